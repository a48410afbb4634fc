# qelt_stand_in_type_infos(TARGET CLASS...): gives the plug-in type infos of its own for classes of namespace Qelt whose
# type infos the host's libraries do not export. The compiler refers to them from the type infos of the plug-in's
# classes; the plug-in itself never asks an object of the host's what it is.
function(qelt_stand_in_type_infos target)
  set(definitions "")
  foreach(class IN LISTS ARGN)
    if(NOT class MATCHES "^[A-Za-z_][A-Za-z0-9_]*$")
      message(FATAL_ERROR "QELT_STAND_IN_TYPE_INFOS: \"${class}\" is no name of a class; they stand without namespace")
    endif()
    string(LENGTH ${class} length)
    string(APPEND definitions "STAND_IN(N4Qelt${length}${class}E)\n")
  endforeach()
  set(source ${CMAKE_CURRENT_BINARY_DIR}/HostTypeInfos.cpp)
  file(CONFIGURE OUTPUT ${source} @ONLY CONTENT [[
// A type info as the C++ ABI lays it out: of a class of which no base is known.
extern "C" {
extern void* _ZTVN10__cxxabiv117__class_type_infoE[];
#define STAND_IN(mangled)                                                                  \
  extern __attribute__((visibility("hidden"))) const void* const _ZTI##mangled[2];         \
  const void* const _ZTI##mangled[2] = {&_ZTVN10__cxxabiv117__class_type_infoE[2], #mangled};
@definitions@}
]])
  target_sources(${target} PRIVATE ${source})
  set_source_files_properties(${source} PROPERTIES SKIP_UNITY_BUILD_INCLUSION ON)
endfunction()

# Where things go below the prefix, and how they get there. Nothing in what is installed names the prefix: it may be
# moved as a whole.
#
# What is installed in parts (cmake --install BUILD --component NAME):
#   plugin   libQeltPencil2.so
#   host     the desktop host's libraries
#   tools    qelt-sketch with its manual page, completion and sample page
#   dev      the headers of both, and what find_package(QeltPencil2) reads; it finds what is installed of plugin and host
#   debug    the debugging information of all of it; left out unless it is asked for

# As on Debian, where libraries of several processors may stand side by side.
if(CMAKE_LIBRARY_ARCHITECTURE AND NOT ANDROID AND NOT DEFINED CMAKE_INSTALL_LIBDIR)
  set(CMAKE_INSTALL_LIBDIR lib/${CMAKE_LIBRARY_ARCHITECTURE} CACHE PATH "Object code libraries")
endif()
include(GNUInstallDirs)
include(CMakePackageConfigHelpers)

# The libraries' names carry no version, as the hosts that load the plug-in expect: where others' libraries are too,
# they have a folder of their own.
if(QELT_DESKTOP)
  set(QELT_INSTALL_LIBDIR ${CMAKE_INSTALL_LIBDIR}/qelt-pencil2)
else()
  set(QELT_INSTALL_LIBDIR ${CMAKE_INSTALL_LIBDIR})
endif()
set(QELT_INSTALL_INCLUDEDIR ${CMAKE_INSTALL_INCLUDEDIR}/qelt-pencil2)
set(QELT_INSTALL_CMAKEDIR ${CMAKE_INSTALL_LIBDIR}/cmake/QeltPencil2)
set(QELT_INSTALL_DATADIR ${CMAKE_INSTALL_DATADIR}/qelt-sketch)

# Everything is installed stripped, also without `cmake --install --strip`: the debugging information has files of its
# own. Said ahead of every other rule.
install(CODE "set(CMAKE_INSTALL_DO_STRIP TRUE)" ALL_COMPONENTS)

# qelt_debuggable(TARGET...): keeps debugging information of what is going to be installed, which changes no code:
# functions and lines, as backtraces show them. Variables as well, with CMAKE_CXX_FLAGS=-g, take a third more time.
function(qelt_debuggable)
  if(EMSCRIPTEN OR CMAKE_CXX_FLAGS MATCHES "-g")
    return()
  endif()
  foreach(target IN LISTS ARGN)
    target_compile_options(${target} PRIVATE $<$<CONFIG:Release>:-g1>)
  endforeach()
endfunction()

# qelt_install_binary(TARGET COMPONENT [EXPORT]): a library, which belongs to an export set, or a program, and its
# debugging information. It looks for the others in the place that they are installed to, seen from its own.
function(qelt_install_binary target component)
  get_target_property(type ${target} TYPE)
  if(QELT_DESKTOP AND type STREQUAL EXECUTABLE)
    cmake_path(RELATIVE_PATH QELT_INSTALL_LIBDIR BASE_DIRECTORY ${CMAKE_INSTALL_BINDIR} OUTPUT_VARIABLE to_libraries)
    set_property(TARGET ${target} PROPERTY INSTALL_RPATH $ORIGIN/${to_libraries})
  elseif(QELT_DESKTOP)
    set(rpath $ORIGIN)
    # The log library lies outside the loader's own folders.
    cmake_path(GET QELT_LOG_LIBRARY PARENT_PATH log_dir)
    if(NOT log_dir IN_LIST CMAKE_CXX_IMPLICIT_LINK_DIRECTORIES)
      list(APPEND rpath ${log_dir})
    endif()
    set_property(TARGET ${target} PROPERTY INSTALL_RPATH ${rpath})
  endif()
  if(type STREQUAL EXECUTABLE)
    install(TARGETS ${target} RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT ${component})
  else()
    install(TARGETS ${target} EXPORT ${ARGV2}
      LIBRARY DESTINATION ${QELT_INSTALL_LIBDIR} COMPONENT ${component}
      ARCHIVE DESTINATION ${QELT_INSTALL_LIBDIR} COMPONENT ${component})
  endif()
  # Named by the build, so that a debugger finds it for whatever was stripped of it, wherever that is.
  install(CODE "
    execute_process(COMMAND \"${CMAKE_READELF}\" -n \"$<TARGET_FILE:${target}>\" OUTPUT_VARIABLE notes
      COMMAND_ERROR_IS_FATAL ANY)
    if(NOT notes MATCHES \"Build ID: ([0-9a-f][0-9a-f])([0-9a-f]+)\")
      message(FATAL_ERROR \"$<TARGET_FILE:${target}>: no build id\")
    endif()
    set(folder \"\$ENV{DESTDIR}\${CMAKE_INSTALL_PREFIX}/lib/debug/.build-id/\${CMAKE_MATCH_1}\")
    set(file \"\${folder}/\${CMAKE_MATCH_2}.debug\")
    file(MAKE_DIRECTORY \"\${folder}\")
    message(STATUS \"Installing: \${file}\")
    execute_process(
      COMMAND \"${CMAKE_OBJCOPY}\" --only-keep-debug --compress-debug-sections \"$<TARGET_FILE:${target}>\" \"\${file}\"
      COMMAND_ERROR_IS_FATAL ANY)
    file(CHMOD \"\${file}\" PERMISSIONS OWNER_READ OWNER_WRITE GROUP_READ WORLD_READ)
    list(APPEND CMAKE_INSTALL_MANIFEST_FILES \"\${file}\")"
    COMPONENT debug EXCLUDE_FROM_ALL)
endfunction()

# qelt_install_headers(FOLDER [UNDER]): the headers in a folder of the sources, to be included as they are here. What a
# platform of the host has for itself is left out.
function(qelt_install_headers folder)
  install(DIRECTORY ${folder}/ DESTINATION ${QELT_INSTALL_INCLUDEDIR}/${ARGN} COMPONENT dev
    FILES_MATCHING PATTERN "*.h" REGEX "/desktop/platform/[a-z]+$" EXCLUDE)
endfunction()

# What find_package(QeltPencil2) reads; after all targets. A file of targets fails where one of its libraries is not
# installed: each part that may be left out has a file of its own.
function(qelt_install_package)
  set(parts Contract Plugin)
  if(QELT_DESKTOP)
    list(APPEND parts Host)
  endif()
  foreach(part IN LISTS parts)
    install(EXPORT QeltPencil2${part}Targets NAMESPACE QeltPencil2:: DESTINATION ${QELT_INSTALL_CMAKEDIR}
      COMPONENT dev)
  endforeach()
  configure_package_config_file(${PROJECT_SOURCE_DIR}/cmake/QeltPencil2Config.cmake.in
    ${PROJECT_BINARY_DIR}/QeltPencil2Config.cmake INSTALL_DESTINATION ${QELT_INSTALL_CMAKEDIR}
    PATH_VARS QELT_INSTALL_LIBDIR)
  # Before 1.0 the contract may change with every minor version.
  write_basic_package_version_file(${PROJECT_BINARY_DIR}/QeltPencil2ConfigVersion.cmake
    COMPATIBILITY SameMinorVersion)
  install(FILES ${PROJECT_BINARY_DIR}/QeltPencil2Config.cmake ${PROJECT_BINARY_DIR}/QeltPencil2ConfigVersion.cmake
    DESTINATION ${QELT_INSTALL_CMAKEDIR} COMPONENT dev)
endfunction()

# The target `prefab`: what is built, as Android's builds take it (Prefab.cmake). The names are those that the NDK's
# toolchain file gives its settings.
function(qelt_add_prefab)
  set(api ${ANDROID_PLATFORM_LEVEL})
  if(NOT api)
    string(REGEX REPLACE "^android-" "" api "${ANDROID_PLATFORM}")
  endif()
  set(ndk ${ANDROID_NDK_MAJOR})
  if(NOT ndk AND EXISTS "${ANDROID_NDK}/source.properties")
    file(READ ${ANDROID_NDK}/source.properties properties)
    string(REGEX REPLACE ".*Pkg.Revision = ([0-9]+).*" "\\1" ndk "${properties}")
  endif()
  add_custom_target(prefab
    COMMAND ${CMAKE_COMMAND} -D BUILD=${PROJECT_BINARY_DIR} -D ABI=${ANDROID_ABI} -D API=${api} -D NDK=${ndk}
      -D STL=${ANDROID_STL} -D VERSION=${PROJECT_VERSION}
      -D OUTPUT=${PROJECT_BINARY_DIR}/qelt-pencil2-${PROJECT_VERSION}.aar -P ${PROJECT_SOURCE_DIR}/cmake/Prefab.cmake
    DEPENDS QeltPencil2 VERBATIM COMMENT "Packing the plug-in for Android")
endfunction()

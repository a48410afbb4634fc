# What cpack makes, in a build folder: three Debian packages, and a fourth with the debugging information of all. Who
# packages for a distribution sets QELT_MAINTAINER.
set(QELT_MAINTAINER "The Qelt pencil authors <qelt-pencil@localhost>" CACHE STRING "Who answers for the packages")

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME qelt-pencil2)
set(CPACK_PACKAGE_VENDOR "The Qelt pencil authors")
set(CPACK_PACKAGE_CONTACT ${QELT_MAINTAINER})
set(CPACK_PACKAGE_CHECKSUM SHA256)
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_COMPRESSION_TYPE xz)
# As Debian calls the processor that is built for, which need not be the one that builds.
find_program(QELT_DPKG_ARCHITECTURE dpkg-architecture)
if(CMAKE_LIBRARY_ARCHITECTURE AND QELT_DPKG_ARCHITECTURE)
  execute_process(
    COMMAND ${QELT_DPKG_ARCHITECTURE} -t${CMAKE_LIBRARY_ARCHITECTURE} -qDEB_HOST_ARCH
    OUTPUT_VARIABLE CPACK_DEBIAN_PACKAGE_ARCHITECTURE OUTPUT_STRIP_TRAILING_WHITESPACE ERROR_QUIET)
endif()

# What others' packages a program or library needs, dpkg-shlibdeps reads from it; it finds ours where they were built.
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS
  ${PROJECT_BINARY_DIR}/plugin ${PROJECT_BINARY_DIR}/host/desktop ${PROJECT_BINARY_DIR}/host/desktop/platform/linux)

# qelt_package(GROUP PACKAGE SECTION DESCRIPTION COMPONENT...): a package of some components, with its copyright.
set(CPACK_COMPONENTS_ALL "")
macro(qelt_package group package section description)
  string(TOUPPER ${group} key)
  set(CPACK_DEBIAN_${key}_PACKAGE_NAME ${package})
  set(CPACK_DEBIAN_${key}_PACKAGE_SECTION ${section})
  set(CPACK_DEBIAN_${key}_DESCRIPTION "${description}")
  foreach(component IN ITEMS ${ARGN})
    string(TOUPPER ${component} component_key)
    set(CPACK_COMPONENT_${component_key}_GROUP ${group})
    list(APPEND CPACK_COMPONENTS_ALL ${component})
  endforeach()
  if(${ARGV4} STREQUAL debug)
    set(only_on_demand EXCLUDE_FROM_ALL)
  else()
    set(only_on_demand "")
  endif()
  install(FILES ${PROJECT_SOURCE_DIR}/LICENSE DESTINATION ${CMAKE_INSTALL_DATADIR}/doc/${package} RENAME copyright
    COMPONENT ${ARGV4} ${only_on_demand})
endmacro()

qelt_package(runtime libqeltpencil2 libs "graphite pencil as a pen plug-in, and its desktop host
libQeltPencil2.so draws handwriting like graphite on grainy paper, with OpenGL ES 3.0.
The libraries beside it implement the host that it is loaded by."
  plugin host)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_RUNTIME_PACKAGE_RECOMMENDS libgl1-mesa-dri)

qelt_package(program qelt-sketch graphics "draws ink files with the graphite pencil
qelt-sketch makes pictures and traces of the pen's work out of InkML."
  tools)
set(CPACK_DEBIAN_PROGRAM_PACKAGE_SHLIBDEPS ON)

qelt_package(development libqeltpencil2-dev libdevel "headers and CMake package of the graphite pencil
What a program needs that hosts the pen: find_package(QeltPencil2) in CMake."
  dev)

qelt_package(debugging qelt-pencil2-dbgsym debug "debug symbols of the graphite pencil
For libqeltpencil2 and qelt-sketch."
  debug)

set(ours "(= ${PROJECT_VERSION})")
set(CPACK_DEBIAN_PROGRAM_PACKAGE_DEPENDS "libqeltpencil2 ${ours}")
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_DEPENDS "libqeltpencil2 ${ours}, libgles-dev")
set(CPACK_DEBIAN_DEBUGGING_PACKAGE_DEPENDS "libqeltpencil2 ${ours}")
include(CPack)

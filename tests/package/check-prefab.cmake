# cmake -D PACKAGE=DIR -D VERSION=... -D ABI=... -P check-prefab.cmake: reads an unpacked prefab package as Android's
# builds do, and stops at what they would not understand.
function(expect file want)
  file(READ ${PACKAGE}/prefab/${file} text)
  string(JSON got GET "${text}" ${ARGN})
  if(NOT got STREQUAL want)
    message(FATAL_ERROR "${file}: ${ARGN} is \"${got}\", not \"${want}\"")
  endif()
endfunction()
expect(prefab.json 2 schema_version)
expect(prefab.json QeltPencil2 name)
expect(prefab.json ${VERSION} version)
expect(prefab.json [] dependencies)
set(module modules/QeltPencil2)
expect(${module}/module.json [] export_libraries)
set(libs ${module}/libs/android.${ABI})
expect(${libs}/abi.json ${ABI} abi)
expect(${libs}/abi.json 29 api)
expect(${libs}/abi.json 23 ndk)
expect(${libs}/abi.json c++_shared stl)
expect(${libs}/abi.json OFF static)

# Nothing of the desktop's, and nothing that is not looked for.
file(GLOB_RECURSE files RELATIVE ${PACKAGE} ${PACKAGE}/*)
list(FILTER files EXCLUDE REGEX
  "^prefab/${module}/include/(base|engine|gl|graphics|math|model|pencommon)/[A-Za-z0-9]+\\.h$")
list(SORT files)
set(wanted AndroidManifest.xml prefab/${libs}/abi.json prefab/${libs}/libQeltPencil2.so prefab/${module}/module.json
  prefab/prefab.json)
if(NOT files STREQUAL wanted)
  message(FATAL_ERROR "The package holds ${files}, not ${wanted}")
endif()

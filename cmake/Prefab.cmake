# Packs the plug-in for Android as a prefab package inside an AAR, the form in which Gradle takes C++ libraries.
#
#   cmake -D BUILD=DIR -D ABI=arm64-v8a -D API=29 -D NDK=23 -D STL=c++_shared -D VERSION=0.1.0 -D OUTPUT=FILE.aar
#         -P cmake/Prefab.cmake
#
# BUILD is a build folder for Android (QELT_DESKTOP=OFF) whose library is built. The target `prefab` says all of this.
cmake_minimum_required(VERSION 3.25)
foreach(name IN ITEMS BUILD ABI API NDK STL VERSION OUTPUT)
  if("${${name}}" STREQUAL "")
    message(FATAL_ERROR "prefab: ${name} is not known; name it with -D ${name}=...")
  endif()
endforeach()
foreach(name IN ITEMS API NDK)
  if(NOT ${name} MATCHES "^[1-9][0-9]*$")
    message(FATAL_ERROR "prefab: ${name} is a number, not \"${${name}}\"")
  endif()
endforeach()

# The folder is the package: it holds what the archive will, and nothing else.
cmake_path(REMOVE_EXTENSION OUTPUT LAST_ONLY OUTPUT_VARIABLE package)
set(module ${package}/prefab/modules/QeltPencil2)
set(libs ${module}/libs/android.${ABI})
file(REMOVE_RECURSE ${package} ${package}.stage ${OUTPUT})
foreach(component IN ITEMS plugin dev)
  execute_process(
    COMMAND ${CMAKE_COMMAND} --install ${BUILD} --prefix ${package}.stage --component ${component}
    OUTPUT_QUIET COMMAND_ERROR_IS_FATAL ANY)
endforeach()
file(GLOB_RECURSE library ${package}.stage/libQeltPencil2.so)
file(MAKE_DIRECTORY ${libs})
file(RENAME ${library} ${libs}/libQeltPencil2.so)
file(RENAME ${package}.stage/include/qelt-pencil2 ${module}/include)
file(REMOVE_RECURSE ${package}.stage)

# A library under the name of another processor would be found out on a device only.
set(machine_of_arm64-v8a b700)
set(machine_of_armeabi-v7a 2800)
set(machine_of_x86 0300)
set(machine_of_x86_64 3e00)
file(READ ${libs}/libQeltPencil2.so machine OFFSET 18 LIMIT 2 HEX)
if(NOT machine STREQUAL "${machine_of_${ABI}}")
  message(FATAL_ERROR "prefab: the library in ${BUILD} is not for ${ABI}")
endif()

file(WRITE ${package}/prefab/prefab.json "{
  \"schema_version\": 2,
  \"name\": \"QeltPencil2\",
  \"version\": \"${VERSION}\",
  \"dependencies\": []
}
")
# The host's libraries, which the plug-in needs, are not in the package: who loads it has loaded them.
file(WRITE ${module}/module.json "{
  \"export_libraries\": []
}
")
file(WRITE ${libs}/abi.json "{
  \"abi\": \"${ABI}\",
  \"api\": ${API},
  \"ndk\": ${NDK},
  \"stl\": \"${STL}\",
  \"static\": false
}
")
file(WRITE ${package}/AndroidManifest.xml "<manifest xmlns:android=\"http://schemas.android.com/apk/res/android\"
    package=\"qelt.pencil2\" android:versionCode=\"1\" android:versionName=\"${VERSION}\">
  <uses-sdk android:minSdkVersion=\"${API}\" />
</manifest>
")
execute_process(
  COMMAND ${CMAKE_COMMAND} -E tar cf ${OUTPUT} --format=zip -- AndroidManifest.xml prefab
  WORKING_DIRECTORY ${package} COMMAND_ERROR_IS_FATAL ANY)
message(STATUS "Packed ${OUTPUT}")

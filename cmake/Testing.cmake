# What every test target shares.
find_package(GTest REQUIRED)
include(GoogleTest)

# All that ThreadSanitizer is asked about.
add_custom_target(qelt_threaded_tests)

# qelt_add_tests(TARGET SOURCES ... [LIBRARIES ...] [LABEL ...] [SHARDS N]): one executable of GoogleTest
# cases, each of them a test of ctest's. The label "threaded" marks what ./check runs under ThreadSanitizer.
# Under an emulator or a sanitizer, where starting a program takes longer than most cases, one test of ctest's
# runs them all, or SHARDS of them share the cases.
function(qelt_add_tests target)
  cmake_parse_arguments(PARSE_ARGV 1 arg "" "LABEL;SHARDS" "SOURCES;LIBRARIES")
  if(NOT arg_LABEL)
    set(arg_LABEL single)
  endif()
  add_executable(${target} ${arg_SOURCES})
  target_link_libraries(${target} PRIVATE qelt_test_support ${arg_LIBRARIES})
  if(arg_LABEL STREQUAL threaded)
    add_dependencies(qelt_threaded_tests ${target})
  endif()
  # A test that needs a GL context takes the software renderer; a loaded machine may need minutes to start it.
  set(environment "EGL_PLATFORM=surfaceless")
  if(CMAKE_CROSSCOMPILING_EMULATOR OR QELT_SANITIZE)
    if(NOT arg_SHARDS)
      set(arg_SHARDS 1)
    endif()
    foreach(shard RANGE 1 ${arg_SHARDS})
      math(EXPR index "${shard} - 1")
      set(name ${target})
      if(arg_SHARDS GREATER 1)
        string(APPEND name .${shard})
      endif()
      add_test(NAME ${name} COMMAND ${target})
      set_tests_properties(${name} PROPERTIES TIMEOUT 900 LABELS ${arg_LABEL}
        ENVIRONMENT "${environment};GTEST_TOTAL_SHARDS=${arg_SHARDS};GTEST_SHARD_INDEX=${index}")
    endforeach()
  else()
    gtest_discover_tests(${target}
      NO_PRETTY_VALUES
      DISCOVERY_TIMEOUT 120
      PROPERTIES TIMEOUT 300 LABELS ${arg_LABEL} ENVIRONMENT ${environment})
  endif()
endfunction()

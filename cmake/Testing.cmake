# What every test target shares.
find_package(GTest REQUIRED)
include(GoogleTest)

# All that ThreadSanitizer is asked about.
add_custom_target(qelt_threaded_tests)

# qelt_add_tests(TARGET SOURCES ... [LIBRARIES ...] [LABEL ...]): one executable of GoogleTest cases, each of
# them a test of ctest's. The label "threaded" marks what ./check runs under ThreadSanitizer. Under an emulator
# or a sanitizer, where starting a program takes longer than most cases, one test of ctest's runs them all.
function(qelt_add_tests target)
  cmake_parse_arguments(PARSE_ARGV 1 arg "" "LABEL" "SOURCES;LIBRARIES")
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
    add_test(NAME ${target} COMMAND ${target})
    set_tests_properties(${target} PROPERTIES TIMEOUT 900 LABELS ${arg_LABEL} ENVIRONMENT ${environment})
  else()
    gtest_discover_tests(${target}
      NO_PRETTY_VALUES
      DISCOVERY_TIMEOUT 120
      PROPERTIES TIMEOUT 300 LABELS ${arg_LABEL} ENVIRONMENT ${environment})
  endif()
endfunction()

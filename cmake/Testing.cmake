# What every test target shares.
find_package(GTest REQUIRED)
include(GoogleTest)

# The headers that most tests include, precompiled once for all of them: they are most of what compiling a test costs.
# A precompiled header serves only what is compiled with the same options.
file(CONFIGURE OUTPUT ${CMAKE_CURRENT_BINARY_DIR}/TestHeaders.cpp CONTENT "")
add_library(qelt_test_headers OBJECT ${CMAKE_CURRENT_BINARY_DIR}/TestHeaders.cpp)
target_link_libraries(qelt_test_headers PRIVATE GTest::gmock GTest::gtest)
target_precompile_headers(qelt_test_headers PRIVATE
  <gmock/gmock.h> <gtest/gtest.h>
  <algorithm> <array> <cmath> <cstddef> <cstdint> <filesystem> <fstream> <functional> <limits> <map> <memory> <random>
  <set> <sstream> <string> <thread> <vector>)

# qelt_compile_as_test(TARGET): with those headers, some sources at once (QELT_UNITY_TESTS), and with little
# optimisation: a test is compiled more often than run. What it tests keeps the options it is released with.
function(qelt_compile_as_test target)
  if(CMAKE_BUILD_TYPE STREQUAL Release)
    # At this level GCC 12 takes `std::string(...) + "..."` for a write past the end.
    target_compile_options(${target} PRIVATE -O1 -Wno-array-bounds)
  else()
    target_compile_options(${target} PRIVATE -O0)
  endif()
  if(QELT_UNITY_TESTS)
    set_property(TARGET ${target} PROPERTY UNITY_BUILD ON)
  endif()
  # Else CMake takes other options for programs than for libraries.
  set_property(TARGET ${target} PROPERTY POSITION_INDEPENDENT_CODE OFF)
  if(NOT target STREQUAL qelt_test_headers)
    target_precompile_headers(${target} REUSE_FROM qelt_test_headers)
  endif()
endfunction()
qelt_compile_as_test(qelt_test_headers)

# All that ThreadSanitizer is asked about, and all that ./check has time to ask another processor.
add_custom_target(qelt_threaded_tests)
add_custom_target(qelt_processor_tests)

# Seconds after which a test program is ended. Under an emulator it takes up to thirty times as long, and the machine may
# be slow or busy besides.
set(QELT_TEST_TIMEOUT 900)
if(CMAKE_CROSSCOMPILING_EMULATOR)
  set(QELT_TEST_TIMEOUT 3600)
endif()

# qelt_add_tests(TARGET SOURCES ... [LIBRARIES ...] [LABEL ...] [PROCESSOR] [SLOW FILTER] [SHARDS N]): one executable of
# GoogleTest cases, each of them a test of ctest's. The label "threaded" marks what ./check runs under ThreadSanitizer,
# "long" what ./check --quick leaves out and what is begun first. PROCESSOR marks what another processor may answer
# differently from the one that everything runs on: there it is labelled "processor" too, and a plain ./check runs nothing
# else.
# Under an emulator or a sanitizer, where starting a program takes longer than most cases, one test of ctest's
# runs them all, or SHARDS of them share the cases. Those of GoogleTest's FILTER are then a test of their own, which is
# never labelled "processor".
function(qelt_add_tests target)
  cmake_parse_arguments(PARSE_ARGV 1 arg "PROCESSOR" "LABEL;SLOW;SHARDS" "SOURCES;LIBRARIES")
  if(arg_UNPARSED_ARGUMENTS)
    message(FATAL_ERROR "qelt_add_tests(${target}) does not know ${arg_UNPARSED_ARGUMENTS}")
  endif()
  if(NOT arg_LABEL)
    set(arg_LABEL single)
  endif()
  add_executable(${target} ${arg_SOURCES})
  target_link_libraries(${target} PRIVATE qelt_test_support ${arg_LIBRARIES})
  qelt_compile_as_test(${target})
  set(labels ${arg_LABEL})
  if(arg_LABEL STREQUAL threaded)
    add_dependencies(qelt_threaded_tests ${target})
  endif()
  if(arg_PROCESSOR)
    list(APPEND labels processor)
    add_dependencies(qelt_processor_tests ${target})
  endif()
  set(cost 0)
  if(arg_LABEL STREQUAL long)
    set(cost 1000)
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
      set_tests_properties(${name} PROPERTIES TIMEOUT ${QELT_TEST_TIMEOUT} LABELS "${labels}" COST ${cost}
        ENVIRONMENT
        "${environment};GTEST_TOTAL_SHARDS=${arg_SHARDS};GTEST_SHARD_INDEX=${index};GTEST_FILTER=-${arg_SLOW}")
    endforeach()
    if(arg_SLOW)
      add_test(NAME ${target}.slow COMMAND ${target})
      set_tests_properties(${target}.slow PROPERTIES TIMEOUT ${QELT_TEST_TIMEOUT} LABELS ${arg_LABEL} COST ${cost}
        ENVIRONMENT "${environment};GTEST_FILTER=${arg_SLOW}")
    endif()
  else()
    # One label, since it takes no lists.
    gtest_discover_tests(${target}
      NO_PRETTY_VALUES
      DISCOVERY_TIMEOUT 120
      PROPERTIES TIMEOUT 300 LABELS ${arg_LABEL} COST ${cost} ENVIRONMENT ${environment})
  endif()
endfunction()

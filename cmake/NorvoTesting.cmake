# Under the sanitizers, the test bodies leave out UBSan's null and alignment checks, which put a
# check before nearly every access in the assertion templates at -O0 and so took a sixth of their
# compile time. The libraries keep every check (but for inline code whose copy the linker takes
# from a test), and a null access in a test body still stops it with AddressSanitizer's report.
if(NORVO_SANITIZE)
  set(NORVO_TEST_BODY_OPTIONS -fno-sanitize=null,alignment)
endif()

# GoogleTest's headers and the common ones, compiled once and shared by every test binary: parsing
# them took a few seconds of each test translation unit.
function(norvo_add_test_pch)
  file(CONFIGURE OUTPUT ${CMAKE_BINARY_DIR}/norvo_test_pch.cc CONTENT "")
  add_library(norvo_test_pch OBJECT ${CMAKE_BINARY_DIR}/norvo_test_pch.cc)
  target_compile_options(norvo_test_pch PRIVATE -O0 ${NORVO_TEST_BODY_OPTIONS})
  target_link_libraries(norvo_test_pch PRIVATE GTest::gtest GTest::gmock)
  target_precompile_headers(norvo_test_pch PRIVATE ${NORVO_COMMON_HEADERS} <gmock/gmock.h>
                            <gtest/gtest.h>)
endfunction()

# norvo_add_test(<name> SOURCES <files...> LIBS <targets...>)
# Builds one GoogleTest binary and registers its tests with CTest.
function(norvo_add_test name)
  cmake_parse_arguments(ARG "" "" "SOURCES;LIBS" ${ARGN})
  if(NOT TARGET norvo_test_pch)
    norvo_add_test_pch()
  endif()
  add_executable(${name} ${ARG_SOURCES})
  # The code under test keeps its build's optimisation; the test bodies run once, and optimising
  # their assertion templates cost a third of their compile time.
  target_compile_options(${name} PRIVATE -O0 ${NORVO_TEST_BODY_OPTIONS})
  target_precompile_headers(${name} REUSE_FROM norvo_test_pch)
  target_link_libraries(${name} PRIVATE ${ARG_LIBS} GTest::gtest GTest::gmock GTest::gtest_main)
  gtest_discover_tests(${name} DISCOVERY_TIMEOUT 60)
endfunction()
include(GoogleTest)

# norvo_add_benchmark(<name> SOURCES <files...> LIBS <targets...>)
# Builds one Google Benchmark binary when `bench` asks for it (not with the tests, which do not
# need it); `make bench` builds and runs them all.
function(norvo_add_benchmark name)
  cmake_parse_arguments(ARG "" "" "SOURCES;LIBS" ${ARGN})
  if(NOT NORVO_BENCHMARKS)
    return()
  endif()
  add_executable(${name} EXCLUDE_FROM_ALL ${ARG_SOURCES})
  target_link_libraries(${name} PRIVATE ${ARG_LIBS} benchmark::benchmark)
  set_property(GLOBAL APPEND PROPERTY NORVO_BENCHMARK_TARGETS ${name})
endfunction()

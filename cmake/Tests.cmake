# How a test is declared.
#
#   qvx_add_unit_test(NAME SOURCES ... LIBRARIES ...)
#       A GoogleTest program that needs no privileges and no kernel feature: CTest runs each of its
#       tests on its own, on the host and, in the arm64 build, under user emulation. Label "unit".
#
#   qvx_add_guest_test(NAME SOURCES ... LIBRARIES ... [PROFILE profile] [TIMEOUT seconds])
#       A GoogleTest program that runs as root inside the virtual handset, one boot for the whole
#       program, which ends with a check that the kernel log holds no complaint about binder. The
#       default profile is "off": the tests bring phones up themselves. Label "guest".

find_package(GTest REQUIRED)
find_package(nlohmann_json REQUIRED)
include(GoogleTest)

# The headers that cost most of a test's compile time, compiled once a build.
if(NOT TARGET test_headers)
    # A program, because programs and libraries are compiled with different options here.
    file(CONFIGURE OUTPUT ${CMAKE_BINARY_DIR}/test_headers.cpp CONTENT "int main() {}\n")
    add_executable(test_headers ${CMAKE_BINARY_DIR}/test_headers.cpp)
    target_link_libraries(test_headers PRIVATE GTest::gmock GTest::gtest nlohmann_json::nlohmann_json)
    target_precompile_headers(test_headers PRIVATE
        <gmock/gmock.h> <gtest/gtest.h> <nlohmann/json.hpp>
        <functional> <map> <optional> <string> <vector>)
endif()

function(qvx_add_unit_test name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "SOURCES;LIBRARIES")
    add_executable(${name} ${arg_SOURCES})
    target_link_libraries(${name} PRIVATE ${arg_LIBRARIES} GTest::gmock GTest::gtest_main)
    target_precompile_headers(${name} REUSE_FROM test_headers)
    gtest_discover_tests(${name} DISCOVERY_MODE PRE_TEST DISCOVERY_TIMEOUT 60
                         TEST_PREFIX "${QVX_TEST_PREFIX}${name}." PROPERTIES LABELS unit TIMEOUT 120)
endfunction()

function(qvx_add_guest_test name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "PROFILE;TIMEOUT" "SOURCES;LIBRARIES")
    if(NOT arg_PROFILE)
        set(arg_PROFILE off)
    endif()
    if(NOT arg_TIMEOUT)
        set(arg_TIMEOUT 300)
    endif()
    math(EXPR ctest_timeout "${arg_TIMEOUT} + 60")
    add_executable(${name} ${arg_SOURCES})
    target_link_libraries(${name} PRIVATE ${arg_LIBRARIES} guest_main)
    target_precompile_headers(${name} REUSE_FROM test_headers)
    # Only a build that holds the handset can boot one.
    if(NOT TARGET handset-agent)
        return()
    endif()
    add_test(NAME ${QVX_TEST_PREFIX}${name}
             COMMAND ${CMAKE_SOURCE_DIR}/handset/run --build ${CMAKE_BINARY_DIR} --arch amd64
                     --profile ${arg_PROFILE} --timeout ${arg_TIMEOUT} -- $<TARGET_FILE:${name}>)
    # One guest at a time: two would share the machine's cores and stretch every sleep.
    set_tests_properties(${QVX_TEST_PREFIX}${name} PROPERTIES LABELS guest
                         RESOURCE_LOCK handset TIMEOUT ${ctest_timeout})
endfunction()

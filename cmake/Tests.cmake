# How a test is declared.
#
#   qvx_add_unit_test(NAME SOURCES ... LIBRARIES ... [HEADERS ...])
#       A GoogleTest program that needs no privileges and no kernel feature. In the release build
#       CTest runs each of its tests on its own; in the others it runs the program, because there
#       the start of a process costs more than a test. Those of the arm64 build run under user
#       emulation. HEADERS are compiled ahead for this program alone, where the common ones are too
#       few. Label "unit".
#
#   qvx_add_guest_test(NAME SOURCES ... LIBRARIES ... [PROFILE profile] [TIMEOUT seconds]
#                      [COUNTED] [FROM_OUTSIDE] [KERNEL_TESTS filter])
#       A GoogleTest program that runs as root inside the virtual handset, one boot for the whole
#       program, which ends with a check that the kernel log holds no complaint about binder. The
#       default profile is "off": the tests bring phones up themselves. The guest is of the build's
#       own architecture. Label "guest". A build without the handset, or one that QVX_GUEST_TESTS
#       keeps from running the program, leaves it out of "all". COUNTED: the guest's clock counts
#       instructions. FROM_OUTSIDE: the program looks at the service through binder and the journal
#       alone, so a build that takes another one's handset takes the program from there too.
#       KERNEL_TESTS: those of its tests that run a second time, on the kernel module's nodes, as
#       NAME.kernel_driver, with the label "kernel" too.
#
#   qvx_add_python_test(SUITE FILE [LABEL labels] [TIMEOUT seconds] [ENVIRONMENT NAME=VALUE ...])
#       The unittest file FILE.py of the directory as the test SUITE.FILE. The default label is
#       "unit".

# Including this file also sets how the including directory's tests are compiled: at the level that
# the binder headers are read at, the same everywhere, so that one set of precompiled headers serves
# every test; and for the time they take to compile, while what they test is optimised as elsewhere.
add_compile_definitions(__ANDROID_API__=31)
add_compile_options(-O0)
qvx_without_hardening()

find_package(GTest REQUIRED)
find_package(nlohmann_json REQUIRED)
include(GoogleTest)

set(QVX_GUEST_TESTS "all" CACHE STRING
    "Guest test programs of this build: \"all\", or their names. Emulated Arm is slow, so its build
    runs the whole request path, and leaves the rest to the others")

set(QVX_HANDSET_BUILD "${CMAKE_BINARY_DIR}" CACHE PATH
    "Build whose handset and client the guest tests use. A sanitizer's build takes the release one's,
    and brings the service and what links its library: what it would add to the others is time")

# What the handset calls the processor this build is for, and how many times as long it is given:
# emulating Arm takes about three times as long as emulating the machine's own kind.
if(CMAKE_SYSTEM_PROCESSOR STREQUAL "aarch64")
    set(guest_architecture arm64)
    set(timeout_factor 3)
else()
    set(guest_architecture amd64)
    set(timeout_factor 1)
endif()

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
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "SOURCES;LIBRARIES;HEADERS")
    add_executable(${name} ${arg_SOURCES})
    qvx_compile_together(${name})
    target_link_libraries(${name} PRIVATE ${arg_LIBRARIES} GTest::gmock GTest::gtest_main)
    if(arg_HEADERS)
        target_precompile_headers(${name} PRIVATE ${arg_HEADERS})
    else()
        target_precompile_headers(${name} REUSE_FROM test_headers)
    endif()
    if(QVX_TEST_PREFIX)
        add_test(NAME ${QVX_TEST_PREFIX}${name} COMMAND ${name})
        set_tests_properties(${QVX_TEST_PREFIX}${name} PROPERTIES LABELS unit TIMEOUT 600)
        return()
    endif()
    gtest_discover_tests(${name} DISCOVERY_MODE PRE_TEST DISCOVERY_TIMEOUT 60 NO_PRETTY_VALUES
                         TEST_PREFIX "${name}." PROPERTIES LABELS unit TIMEOUT 120)
endfunction()

function(qvx_add_guest_test name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "COUNTED;FROM_OUTSIDE" "KERNEL_TESTS;PROFILE;TIMEOUT"
                          "SOURCES;LIBRARIES")
    if(NOT arg_PROFILE)
        set(arg_PROFILE off)
    endif()
    if(NOT arg_TIMEOUT)
        set(arg_TIMEOUT 300)
    endif()
    math(EXPR timeout "${arg_TIMEOUT} * ${timeout_factor}")
    math(EXPR ctest_timeout "${timeout} + 60")
    add_executable(${name} ${arg_SOURCES})
    qvx_compile_together(${name})
    target_link_libraries(${name} PRIVATE ${arg_LIBRARIES} guest_main)
    target_precompile_headers(${name} REUSE_FROM test_headers)
    # Only a build that holds the handset can boot one; which target it has is not known yet where a
    # component that comes before it declares its tests.
    if(NOT ("handset" IN_LIST QVX_COMPONENTS OR NOT QVX_HANDSET_BUILD STREQUAL CMAKE_BINARY_DIR)
       OR NOT (QVX_GUEST_TESTS STREQUAL "all" OR name IN_LIST QVX_GUEST_TESTS))
        set_target_properties(${name} PROPERTIES EXCLUDE_FROM_ALL ON)
        return()
    endif()
    set(program $<TARGET_FILE:${name}>)
    if(arg_FROM_OUTSIDE AND NOT QVX_HANDSET_BUILD STREQUAL CMAKE_BINARY_DIR)
        set(program ${QVX_HANDSET_BUILD}/bin/${name})
        set_target_properties(${name} PROPERTIES EXCLUDE_FROM_ALL ON)
    endif()
    set(service $<TARGET_FILE:android.hardware.vibrator-service.quorvan>)
    set(run ${CMAKE_SOURCE_DIR}/handset/run --build ${QVX_HANDSET_BUILD} --arch ${guest_architecture}
            --profile ${arg_PROFILE} --timeout ${timeout})
    if(arg_COUNTED)
        list(APPEND run --counted)
    endif()
    set(tests ${QVX_TEST_PREFIX}${name})
    add_test(NAME ${QVX_TEST_PREFIX}${name}
             COMMAND ${run} -- env PHONE_SERVICE=${service} ${program})
    # Once is enough for what the sanitizers do not look at.
    if(arg_KERNEL_TESTS AND QVX_HANDSET_BUILD STREQUAL CMAKE_BINARY_DIR)
        list(APPEND tests ${QVX_TEST_PREFIX}${name}.kernel_driver)
        add_test(NAME ${QVX_TEST_PREFIX}${name}.kernel_driver
                 COMMAND ${run} --driver kernel -- env PHONE_SERVICE=${service} ${program}
                         --gtest_filter=${arg_KERNEL_TESTS})
    endif()
    # Each guest is one processor's worth of work, so as many run side by side as CTest is told to run
    # tests. They form the longest chain and come first, which is what a high cost makes them.
    set_tests_properties(${tests} PROPERTIES LABELS guest TIMEOUT ${ctest_timeout} COST ${timeout})
    if(TEST ${QVX_TEST_PREFIX}${name}.kernel_driver)
        set_tests_properties(${QVX_TEST_PREFIX}${name}.kernel_driver PROPERTIES LABELS "guest;kernel")
    endif()
endfunction()

function(qvx_add_python_test suite file)
    cmake_parse_arguments(PARSE_ARGV 2 arg "" "LABEL;TIMEOUT" "ENVIRONMENT")
    if(NOT arg_LABEL)
        set(arg_LABEL unit)
    endif()
    if(NOT arg_TIMEOUT)
        set(arg_TIMEOUT 300)
    endif()
    set(name ${QVX_TEST_PREFIX}${suite}.${file})
    add_test(NAME ${name} COMMAND /usr/bin/python3 -B -m unittest -v ${file}
             WORKING_DIRECTORY ${CMAKE_CURRENT_SOURCE_DIR})
    set_tests_properties(${name} PROPERTIES LABELS "${arg_LABEL}" TIMEOUT ${arg_TIMEOUT}
                         ENVIRONMENT "${arg_ENVIRONMENT}")
    if("guest" IN_LIST arg_LABEL)
        set_tests_properties(${name} PROPERTIES COST ${arg_TIMEOUT})
    endif()
endfunction()

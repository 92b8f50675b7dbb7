# The rooms of the house: how a library is built, and who may include whom.
#
# A room's headers are reachable through its target alone. Since each room has
# an include directory of its own and libraries are linked PRIVATE or PUBLIC as
# their headers need, including a header of a room that is not linked does not
# compile.

# Where the headers of the platform are installed.
set(ZR_INSTALL_INCLUDEDIR ${CMAKE_INSTALL_INCLUDEDIR}/dhcp-client-provider)

set(ZR_WARNINGS
    -Wall -Wextra -Wpedantic
    -Wconversion -Wsign-conversion -Wshadow -Wnull-dereference
    -Wcast-align -Wcast-qual -Wformat=2 -Wimplicit-fallthrough -Wundef)
set(ZR_CXX_WARNINGS
    -Wold-style-cast -Woverloaded-virtual -Wnon-virtual-dtor -Wextra-semi)
# g++ 12 sees overlapping copies in std::string's operator+ where there are none.
set(ZR_GNU_WARNINGS -Wduplicated-branches -Wduplicated-cond -Wlogical-op -Wno-restrict)
# Of a source that is included in another, g++ takes a type that is known there alone for one
# of a header, and where it puts much into one function it sees faults in the standard
# library that are not there.
if(ZR_COMPILED_TOGETHER)
    list(APPEND ZR_GNU_WARNINGS $<$<COMPILE_LANGUAGE:CXX>:-Wno-subobject-linkage> -Wno-null-dereference -Wno-array-bounds
         -Wno-stringop-overflow -Wno-stringop-overread)
endif()

add_library(zr_options INTERFACE)
target_compile_options(zr_options INTERFACE
    ${ZR_WARNINGS}
    $<$<COMPILE_LANGUAGE:CXX>:${ZR_CXX_WARNINGS}>
    $<$<CXX_COMPILER_ID:GNU>:${ZR_GNU_WARNINGS}>
    # Other compilers than those of the presets know other warnings.
    $<$<BOOL:${ZR_WERROR}>:-Werror>)

if(ZR_SANITIZERS)
    # Each check is optimised, too, which takes longer than the tests gain by it; a fuzz
    # target runs for long.
    add_compile_options(-fsanitize=${ZR_SANITIZERS} -fno-sanitize-recover=all
                        -fno-omit-frame-pointer -g1 $<IF:$<BOOL:${ZR_FUZZERS}>,-O1,-O0>)
    add_link_options(-fsanitize=${ZR_SANITIZERS})
    # Such programs are large: this linker takes a quarter of the other's time.
    if(CMAKE_CXX_COMPILER_ID STREQUAL Clang)
        add_link_options(-fuse-ld=lld)
    endif()
    # The check of virtual tables looks at memory through a pipe, and reports a fault
    # when a test has taken all descriptors away.
    if(ZR_SANITIZERS MATCHES undefined)
        add_compile_options(-fno-sanitize=vptr)
    endif()
    add_compile_definitions(ZR_SANITIZERS="${ZR_SANITIZERS}")
endif()
if(ZR_FUZZERS)
    # The targets learn from which code an input reaches.
    add_compile_options(-fsanitize=fuzzer-no-link)
    add_link_options(-fsanitize=fuzzer-no-link)
endif()
if(ZR_COVERAGE)
    add_compile_options(-fprofile-instr-generate -fcoverage-mapping -O0)
    add_link_options(-fprofile-instr-generate)
endif()

# The headers of the standard library that most sources include, compiled once: half of a
# source's compile time would go into them. A source still includes what it uses; the
# linter, which does without this, would find what is left out.
file(CONFIGURE OUTPUT ${CMAKE_BINARY_DIR}/room_headers.cpp CONTENT "// Compiled for its headers.\n")
add_library(room_headers OBJECT ${CMAKE_BINARY_DIR}/room_headers.cpp)
target_link_libraries(room_headers PRIVATE zr_options)
target_precompile_headers(room_headers PRIVATE
    <algorithm> <array> <atomic> <charconv> <chrono> <cstdint> <filesystem> <functional> <map>
    <memory> <mutex> <optional> <span> <sstream> <string> <string_view> <system_error>
    <unordered_map> <unordered_set> <utility> <variant> <vector>)

# zr_small(file...): in optimised builds, these are to be small rather than quick.
function(zr_small)
    if(CMAKE_BUILD_TYPE STREQUAL "Release")
        set_source_files_properties(${ARGN} PROPERTIES COMPILE_OPTIONS -Os)
    endif()
endfunction()

# zr_precompiled(TARGET) lets a library of the product use these. Headers fit only
# options like their own: a source that is optimised in another way goes without.
function(zr_precompiled target)
    get_target_property(sources ${target} SOURCES)
    foreach(source IN LISTS sources)
        get_source_file_property(options ${source} COMPILE_OPTIONS)
        if(options)
            set_source_files_properties(${source} PROPERTIES SKIP_PRECOMPILE_HEADERS ON)
        endif()
    endforeach()
    target_precompile_headers(${target} REUSE_FROM room_headers)
endfunction()

# zr_busy(TARGET): most of the tests' time is spent in this library. With the address
# sanitizer it is optimised, without headers that were compiled with other options; the
# tests of the thread sanitizer are too few for that to pay.
function(zr_busy target)
    if(ZR_SANITIZERS MATCHES address AND NOT ZR_FUZZERS)
        target_compile_options(${target} PRIVATE -O1)
        set_target_properties(${target} PROPERTIES DISABLE_PRECOMPILE_HEADERS ON)
    endif()
endfunction()

# zr_compiled_as_one(TARGET [EXCEPT file|folder/...]): the sources of each folder of the
# target are compiled as one, but for those whose own names another one of the folder has,
# too: headers are then read, and what is instantiated of templates is made, once.
function(zr_compiled_as_one target)
    cmake_parse_arguments(TOGETHER "" "" "EXCEPT" ${ARGN})
    set_target_properties(${target} PROPERTIES UNITY_BUILD ON UNITY_BUILD_MODE GROUP)
    get_target_property(sources ${target} SOURCES)
    foreach(source IN LISTS sources)
        cmake_path(ABSOLUTE_PATH source BASE_DIRECTORY ${CMAKE_CURRENT_SOURCE_DIR})
        cmake_path(RELATIVE_PATH source BASE_DIRECTORY ${CMAKE_CURRENT_SOURCE_DIR})
        cmake_path(GET source PARENT_PATH folder)
        string(MAKE_C_IDENTIFIER "${target}/${folder}" group)
        if(NOT source IN_LIST TOGETHER_EXCEPT AND NOT "${folder}/" IN_LIST TOGETHER_EXCEPT)
            set_source_files_properties(${source} PROPERTIES UNITY_GROUP ${group})
        endif()
    endforeach()
endfunction()

# zr_compiled_together(TARGET [EXCEPT file|folder/...]): the same for a library of the
# product, with ZR_COMPILED_TOGETHER, as for scripts/run and the sanitizers.
function(zr_compiled_together target)
    if(ZR_COMPILED_TOGETHER)
        zr_compiled_as_one(${target} ${ARGN})
    endif()
endfunction()

# zr_room(NAME SOURCES file... [ROOT directory] [LINKS target...] [PRIVATE_LINKS target...]
#         [ALONE file|folder/...])
# A static library whose public headers are under include/, and whose own are named from
# ROOT, which is src unless given. ALONE: what is never compiled together.
function(zr_room name)
    cmake_parse_arguments(ROOM "" "ROOT" "SOURCES;LINKS;PRIVATE_LINKS;ALONE" ${ARGN})
    if(NOT ROOM_ROOT)
        set(ROOM_ROOT src)
    endif()
    add_library(${name} STATIC ${ROOM_SOURCES})
    target_include_directories(${name}
        PUBLIC $<BUILD_INTERFACE:${CMAKE_CURRENT_SOURCE_DIR}/include>
               $<INSTALL_INTERFACE:${ZR_INSTALL_INCLUDEDIR}>
        PRIVATE ${ROOM_ROOT})
    target_link_libraries(${name} PUBLIC ${ROOM_LINKS}
                          PRIVATE $<BUILD_INTERFACE:zr_options> ${ROOM_PRIVATE_LINKS})
    zr_precompiled(${name})
    zr_compiled_together(${name} EXCEPT ${ROOM_ALONE})
endfunction()

# zr_provider_library(NAME OBJECTS target... COMPONENT component EXPORTS symbol...)
# A CMPI provider library, made of object libraries, that exports exactly the
# symbols named, and belongs to a component of the installation.
function(zr_provider_library name)
    cmake_parse_arguments(LIBRARY "" "COMPONENT" "OBJECTS;EXPORTS" ${ARGN})
    set(map ${CMAKE_CURRENT_BINARY_DIR}/${name}.map)
    list(JOIN LIBRARY_EXPORTS "; " exports)
    file(CONFIGURE OUTPUT ${map} CONTENT "{ global: @exports@; local: *; };\n" @ONLY)
    list(TRANSFORM LIBRARY_OBJECTS REPLACE "(.+)" "$<TARGET_OBJECTS:\\1>" OUTPUT_VARIABLE sources)
    add_library(${name} MODULE ${sources})
    target_link_libraries(${name} PRIVATE zr_options ${LIBRARY_OBJECTS})
    set_target_properties(${name} PROPERTIES LINK_DEPENDS ${map}
                          LIBRARY_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/lib/cmpi)
    target_link_options(${name} PRIVATE -Wl,--version-script=${map} -Wl,--gc-sections)
    if(NOT ZR_SANITIZERS)
        target_link_options(${name} PRIVATE -Wl,--no-undefined)
    endif()
    install(TARGETS ${name} LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}/cmpi
            COMPONENT ${LIBRARY_COMPONENT})
endfunction()

# What tests are built for is to run once: optimising them costs more than it saves,
# most of all when each check of a sanitizer is optimised, too. Undefined behaviour is looked
# for in what is tested: checking the tests' own sources for it is a quarter of their compile time.
# g++ 12 sees null pointers in the standard library's streams where there are none.
add_library(test_options INTERFACE)
target_compile_options(test_options INTERFACE
    -O0 $<$<CXX_COMPILER_ID:GNU>:-Wno-null-dereference>)
if(ZR_SANITIZERS MATCHES undefined)
    target_compile_options(test_options INTERFACE -fno-sanitize=undefined)
endif()
# The hosts of the kit are where many tests spend their time.
add_library(test_host_options INTERFACE)
target_compile_options(test_host_options INTERFACE
    -O1 $<$<CXX_COMPILER_ID:GNU>:-Wno-null-dereference>)

# The headers that every test includes, compiled once: most of a test's compile
# time would go into them. With the printers, so that no comparison shows mere bytes.
function(zr_test_headers)
    file(CONFIGURE OUTPUT ${CMAKE_BINARY_DIR}/test_headers.cpp CONTENT "int main() {}\n")
    add_executable(test_headers ${CMAKE_BINARY_DIR}/test_headers.cpp)
    target_link_libraries(test_headers PRIVATE zr_options test_options GTest::gtest GTest::gmock)
    target_compile_definitions(test_headers PRIVATE ZR_SOURCE_DIR="${PROJECT_SOURCE_DIR}"
                               ZR_BINARY_DIR="${PROJECT_BINARY_DIR}")
    target_precompile_headers(test_headers PRIVATE
        <gmock/gmock.h> <gtest/gtest.h> ${PROJECT_SOURCE_DIR}/tests/kit/Printers.h)
endfunction()

# zr_test(NAME SOURCES file... [LINKS target...] [LABELS label...] [ENVIRONMENT NAME=value]
#         [COST seconds] [SERIAL] [ONE_THREAD | THREADS_IN filter] [APART])
# One test program. In a developer's build, each of its tests is a test of its own to ctest;
# where its sources are compiled together, the program is one, unless APART is given: starting
# it takes longer than most of its tests.
# COST: what its longest takes, so that a machine with several processors begins with it.
# SERIAL: no other test runs meanwhile. ONE_THREAD: nothing in it is used by two threads at
# once, so that the thread sanitizer has nothing to find; THREADS_IN: but for these of its
# tests, and that sanitizer runs no other. APART: its tests need a process each,
# or take so long that several run at once.
function(zr_test name)
    cmake_parse_arguments(TEST "SERIAL;ONE_THREAD;APART" "COST;THREADS_IN" "SOURCES;LINKS;LABELS;ENVIRONMENT" ${ARGN})
    if(NOT TARGET test_headers)
        zr_test_headers()
    endif()
    add_executable(${name} ${TEST_SOURCES})
    # A program with C sources would want the same headers for C.
    if(NOT TEST_SOURCES MATCHES "\\.c(;|$)")
        target_precompile_headers(${name} REUSE_FROM test_headers)
    endif()
    target_link_libraries(${name} PRIVATE zr_options test_options ${TEST_LINKS} GTest::gtest GTest::gmock
                          GTest::gtest_main)
    target_compile_definitions(${name} PRIVATE ZR_SOURCE_DIR="${PROJECT_SOURCE_DIR}"
                               ZR_BINARY_DIR="${PROJECT_BINARY_DIR}")
    if(ZR_TESTS_COMPILED_TOGETHER)
        zr_compiled_as_one(${name})
    endif()
    if(TEST_ONE_THREAD AND ZR_SANITIZERS MATCHES thread)
        set_target_properties(${name} PROPERTIES EXCLUDE_FROM_ALL ON)
        return()
    endif()
    # Six times the weight of those with real DHCP clients, which mostly wait. Those begin
    # a little later, and fill the time beside all others.
    set(properties PROCESSORS 6)
    if(TEST_SERIAL)
        list(APPEND properties RUN_SERIAL TRUE)
    endif()
    if(NOT TEST_COST)
        set(TEST_COST 50)
    endif()
    list(APPEND properties COST ${TEST_COST})
    if(TEST_LABELS)
        list(APPEND properties LABELS "${TEST_LABELS}")
    endif()
    if(TEST_ENVIRONMENT)
        list(APPEND properties ENVIRONMENT "${TEST_ENVIRONMENT}")
    endif()
    if(ZR_TESTS_COMPILED_TOGETHER AND NOT TEST_APART)
        set(filter "*")
        if(TEST_THREADS_IN AND ZR_SANITIZERS MATCHES thread)
            set(filter ${TEST_THREADS_IN})
            # A filter that fits no test any more would pass.
            list(APPEND properties FAIL_REGULAR_EXPRESSION "PASSED  . 0 tests")
        endif()
        add_test(NAME ${name} COMMAND ${name} --gtest_brief=1 --gtest_filter=${filter})
        set_tests_properties(${name} PROPERTIES ${properties} TIMEOUT 600)
    else()
        gtest_discover_tests(${name} DISCOVERY_MODE PRE_TEST PROPERTIES ${properties} TIMEOUT 120)
    endif()
endfunction()
include(GoogleTest)

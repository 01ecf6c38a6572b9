# What every folder of tests needs: GoogleTest and ic_add_test.
include(GoogleTest)
list(JOIN CMAKE_CROSSCOMPILING_EMULATOR " " emulator)

# Tests compile faster without optimisation, and compiling takes longer than running them. The code under test keeps
# the options of the preset.
if(CMAKE_CXX_FLAGS MATCHES "-fsanitize")
    set(quick_options -O0)
else()
    set(quick_options $<$<CONFIG:Release>:-O1>)
endif()
macro(ic_compile_quickly)
    add_compile_options(${quick_options})
endmacro()

# nlohmann/json for the tests of IC/json.h. Its headers fit every machine, but the folder around them has those of this
# machine: a cross compiler gets a folder with them alone.
find_package(nlohmann_json 3.11 QUIET)
if(NOT nlohmann_json_FOUND)
    message(STATUS "IC: IC/json.h is not tested: the Debian package nlohmann-json3-dev is missing")
elseif(CMAKE_CROSSCOMPILING)
    get_target_property(json_folder nlohmann_json::nlohmann_json INTERFACE_INCLUDE_DIRECTORIES)
    list(GET json_folder 0 json_folder)  # the package names it twice
    file(MAKE_DIRECTORY ${PROJECT_BINARY_DIR}/nlohmann)
    file(CREATE_LINK ${json_folder}/nlohmann ${PROJECT_BINARY_DIR}/nlohmann/nlohmann SYMBOLIC)
    set_target_properties(nlohmann_json::nlohmann_json PROPERTIES
        INTERFACE_INCLUDE_DIRECTORIES ${PROJECT_BINARY_DIR}/nlohmann)
endif()

# Precompiles GoogleTest's headers for all tests, with their options: compilers refuse a header compiled with others.
# The preset `clang` turns this off, so that each test must include all it uses.
add_executable(test_headers ${CMAKE_CURRENT_LIST_DIR}/GoogleTest.cpp)  # an executable, because its users are
ic_target_settings(test_headers)
target_compile_options(test_headers PRIVATE ${quick_options})
target_link_libraries(test_headers PRIVATE GTest::gmock)
target_precompile_headers(test_headers PRIVATE <gmock/gmock.h> <gtest/gtest.h>)

add_library(full_disk OBJECT ${CMAKE_CURRENT_LIST_DIR}/FullDisk.cpp)
ic_target_settings(full_disk)
target_link_libraries(full_disk PRIVATE GTest::gtest)

# The tests that ThreadSanitizer can check.
add_custom_target(threads_tests)
set(with_threads SharedNodes FirstUse Fork Cancellation Unload SpdlogSink)
if(NOT CMAKE_CXX_COMPILER_ID STREQUAL "Clang")  # these replace operator new, as clang's ThreadSanitizer does
    list(APPEND with_threads Alert Failure JournalSink Node Platform)
endif()

# Adds the test NAME_test.cpp, linked with the further arguments.
function(ic_add_test name)
    add_executable(${name}_test ${name}_test.cpp $<TARGET_OBJECTS:full_disk>)
    ic_target_settings(${name}_test)
    target_include_directories(${name}_test PRIVATE ${PROJECT_SOURCE_DIR}/tests)
    target_precompile_headers(${name}_test REUSE_FROM test_headers)
    target_link_libraries(${name}_test PRIVATE ${ARGN} GTest::gmock_main)
    set(label "")
    if(name IN_LIST with_threads)
        add_dependencies(threads_tests ${name}_test)
        set(label PROPERTIES LABELS threads)
    endif()
    gtest_discover_tests(${name}_test DISCOVERY_TIMEOUT 60 ${label})
endfunction()

# Tests that the marked lines of the source do not compile, see refused.sh.
function(ic_add_refused name source)
    set(standard 17)
    if(CMAKE_CXX_STANDARD)
        set(standard ${CMAKE_CXX_STANDARD})
    endif()
    add_test(NAME ${name} COMMAND ${CMAKE_CURRENT_FUNCTION_LIST_DIR}/refused.sh ${CMAKE_CURRENT_SOURCE_DIR}/${source}
        ${CMAKE_CXX_COMPILER} -std=c++${standard} -Wall -Wextra -Wpedantic -Wshadow -Wold-style-cast -Werror
        "-I$<JOIN:$<TARGET_PROPERTY:IC,INTERFACE_INCLUDE_DIRECTORIES>,;-I>"
        "-I$<JOIN:$<TARGET_PROPERTY:IC::ZQ,INTERFACE_INCLUDE_DIRECTORIES>,;-I>"
        COMMAND_EXPAND_LISTS)
endfunction()

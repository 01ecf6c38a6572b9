# Builds and runs the example of a provider's test against the installed library, and expects CMake to refuse a program
# that is linked with the library twice.
#
#   BUILD, EXAMPLE, WORK    the build of the library, the example, a folder that is emptied
#   GENERATOR, SETTINGS     CMake's generator, and the file of cache variables for each project
file(REMOVE_RECURSE ${WORK})
set(configure ${CMAKE_COMMAND} -G ${GENERATOR} -C ${SETTINGS} -DCMAKE_PREFIX_PATH=${WORK}/prefix)

execute_process(COMMAND ${CMAKE_COMMAND} --install ${BUILD} --prefix ${WORK}/prefix
    OUTPUT_QUIET COMMAND_ERROR_IS_FATAL ANY)
execute_process(COMMAND ${configure} -S ${EXAMPLE} -B ${WORK}/build OUTPUT_QUIET COMMAND_ERROR_IS_FATAL ANY)
execute_process(COMMAND ${CMAKE_COMMAND} --build ${WORK}/build COMMAND_ERROR_IS_FATAL ANY)
execute_process(COMMAND ctest --test-dir ${WORK}/build --output-on-failure --no-tests=error COMMAND_ERROR_IS_FATAL ANY)

file(WRITE ${WORK}/both/CMakeLists.txt "cmake_minimum_required(VERSION 3.25)
project(both LANGUAGES CXX)
find_package(IC 1 REQUIRED COMPONENTS Testing)
file(WRITE main.cpp \"int main() { }\\n\")
add_executable(both main.cpp)
target_link_libraries(both PRIVATE IC::IC IC::Testing)
")
execute_process(COMMAND ${configure} -S ${WORK}/both -B ${WORK}/both/build
    OUTPUT_QUIET ERROR_VARIABLE refusal RESULT_VARIABLE result)
if(result EQUAL 0 OR NOT refusal MATCHES "INTERFACE_IC_PLATFORM")
    message(FATAL_ERROR "A program was linked with IC::IC and IC::Testing: ${result}\n${refusal}")
endif()

# Fails unless PROGRAM prints provider.txt. The last folder is the first one again: both sensors recover.
execute_process(COMMAND ${PROGRAM} samples/1 samples/2 samples/3 samples/1
    WORKING_DIRECTORY ${CMAKE_CURRENT_LIST_DIR} OUTPUT_VARIABLE printed COMMAND_ERROR_IS_FATAL ANY)
file(READ ${CMAKE_CURRENT_LIST_DIR}/provider.txt expected)
if(NOT printed STREQUAL expected)
    message(FATAL_ERROR "The provider prints\n${printed}instead of\n${expected}")
endif()

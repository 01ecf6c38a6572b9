# The README shows the program as it is in examples/ and what it prints, and the program prints it.
#
#   README, SOURCE, PROGRAM    the page, the program's source, the program built from it
#   EMULATOR                   what runs a program of another machine; empty for this one
file(READ ${README} readme)
file(READ ${SOURCE} source)
separate_arguments(emulator UNIX_COMMAND "${EMULATOR}")
execute_process(COMMAND ${emulator} ${PROGRAM} OUTPUT_VARIABLE output ERROR_QUIET COMMAND_ERROR_IS_FATAL ANY)

foreach(shown "```cpp\n${source}```" "```text\n${output}```")
    string(FIND "${readme}" "${shown}" position)
    if(position EQUAL -1)
        message(FATAL_ERROR "${README} does not show\n${shown}")
    endif()
endforeach()

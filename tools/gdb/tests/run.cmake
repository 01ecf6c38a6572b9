# Fails unless GDB shows the values of a program as in shown.txt.
#
#   GDB        the debugger
#   PROGRAM    the program
#   PRINTERS   the script that GDB loads
#   BUILD      optional. The build is installed below PREFIX, with the folders LIBRARIES and DATA; the program uses the
#              installed library, and GDB loads the installed script automatically.
if(BUILD)
    file(REMOVE_RECURSE ${PREFIX})
    execute_process(COMMAND ${CMAKE_COMMAND} --install ${BUILD} --prefix ${PREFIX}
                    OUTPUT_QUIET COMMAND_ERROR_IS_FATAL ANY)
    set(load -iex "add-auto-load-scripts-directory ${PREFIX}/${DATA}/gdb/auto-load"
             -iex "add-auto-load-safe-path ${PREFIX}/${DATA}/gdb/auto-load"
             -iex "set environment LD_LIBRARY_PATH ${PREFIX}/${LIBRARIES}")
else()
    set(load -iex "source ${PRINTERS}")
endif()
execute_process(COMMAND ${GDB} -nx -batch -iex "set debuginfod enabled off" ${load}
                        -x ${CMAKE_CURRENT_LIST_DIR}/commands.gdb ${PROGRAM}
                OUTPUT_VARIABLE output ERROR_VARIABLE output)
string(REGEX REPLACE "^.*\nBreakpoint 1, [^\n]*\n[^\n]*\n" "" shown "${output}")
# Where the content of an object that is missing would be depends on the containers of the standard library.
string(REGEX REPLACE "(memory at address) 0x[0-9a-f]?[0-9a-f]>" "\\1 0x10>" shown "${shown}")
file(READ ${CMAKE_CURRENT_LIST_DIR}/shown.txt expected)
if(NOT shown STREQUAL expected)
    message(FATAL_ERROR "GDB shows\n${output}\ninstead of\n${expected}")
endif()

# A page shows each example as its file has it and what it prints, in this order, and nothing else: every block ```cpp
# is an example, every block ```text the output of the example before it, and every block ```cmake a part of an example
# that is a CMakeLists.txt.
#
#   PAGE        the page
#   EXAMPLES    the sources; behind a "|" the program, where there is one: then what it prints stands beside the
#               source in a .txt
#   EMULATOR    what runs a program of another machine; empty for this one
file(READ ${PAGE} rest)
separate_arguments(emulator UNIX_COMMAND "${EMULATOR}")

# The page from here on must show `content` as its next block.
function(expect_block language content origin)
    string(REGEX MATCH "\n```(cpp|text|cmake)\n" fence "${rest}")
    if(NOT fence STREQUAL "\n```${language}\n")
        message(FATAL_ERROR "${PAGE} does not show ${origin}")
    endif()
    string(FIND "${rest}" "${fence}" position)
    string(LENGTH "${fence}" length)
    math(EXPR position "${position} + ${length}")
    string(SUBSTRING "${rest}" ${position} -1 rest)
    string(FIND "${rest}" "```" position)
    string(SUBSTRING "${rest}" 0 ${position} shown)
    if(language STREQUAL "cmake")
        string(FIND "${content}" "\n${shown}" position)
    elseif(shown STREQUAL content)
        set(position 0)
    else()
        set(position -1)
    endif()
    if(position EQUAL -1)
        message(FATAL_ERROR "${PAGE} shows\n${shown}instead of ${origin}, which is\n${content}")
    endif()
    string(LENGTH "${shown}" length)
    string(SUBSTRING "${rest}" ${length} -1 rest)
    set(rest "${rest}" PARENT_SCOPE)
endfunction()

foreach(example IN LISTS EXAMPLES)
    string(REPLACE "|" ";" example "${example}")
    list(POP_FRONT example source)
    file(READ ${source} code)
    if(source MATCHES "CMakeLists.txt$")
        expect_block(cmake "${code}" ${source})
    else()
        expect_block(cpp "${code}" ${source})
    endif()
    if(example)
        execute_process(COMMAND ${emulator} ${example} OUTPUT_VARIABLE output ERROR_QUIET COMMAND_ERROR_IS_FATAL ANY)
        string(REGEX REPLACE "\\.cpp$" ".txt" text ${source})
        file(READ ${text} expected)
        if(NOT output STREQUAL expected)
            message(FATAL_ERROR "${source} prints\n${output}instead of ${text}, which is\n${expected}")
        endif()
        expect_block(text "${expected}" ${text})
    endif()
endforeach()

string(REGEX MATCH "\n```(cpp|text|cmake)\n.*" left_over "${rest}")
if(NOT left_over STREQUAL "")
    message(FATAL_ERROR "${PAGE} shows more than its examples:${left_over}")
endif()

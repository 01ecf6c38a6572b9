# The pages whose programs are files: each page, and what it shows, in its order.

# ic_test_page(NAME PAGE EXAMPLE...): an example is a source below examples/ or tests/, or SOURCE=TARGET for one that
# is run.
function(ic_test_page name page)
    list(APPEND tested_pages ${page})
    set(tested_pages ${tested_pages} PARENT_SCOPE)
    set(examples)
    foreach(example IN LISTS ARGN)
        string(REGEX REPLACE "=(.*)" "|$<TARGET_FILE:\\1>" example ${example})
        list(APPEND examples ${PROJECT_SOURCE_DIR}/${example})
    endforeach()
    add_test(NAME ${name} COMMAND ${CMAKE_COMMAND} -D PAGE=${PROJECT_SOURCE_DIR}/${page} -D "EXAMPLES=${examples}"
        -D EMULATOR=${emulator} -P ${CMAKE_CURRENT_FUNCTION_LIST_DIR}/page.cmake)
endfunction()

if(TARGET fan)
    ic_test_page(readme README.md examples/fan/fan.cpp=fan tests/consumer/CMakeLists.txt)
endif()

if(TARGET guide-01-derive-a-node)
    set(examples)
    foreach(step 01-derive-a-node Fan.h 02-fill-it 03-read-and-convert 04-change-a-property 05-handle-a-refusal
                 06-write-to-the-log 07-connect-your-logging 08-share-a-node 09-raise-an-alert)
        if(step MATCHES "\\.h$")
            list(APPEND examples examples/guide/${step})
        else()
            list(APPEND examples examples/guide/${step}.cpp=guide-${step})
        endif()
    endforeach()
    ic_test_page(guide docs/guide.md ${examples})
endif()

if(TARGET trap-infinity)
    set(examples)
    foreach(trap integers-are-kinds bytes-are-kinds)
        list(APPEND examples examples/traps/${trap}.cpp=trap-${trap})
    endforeach()
    list(APPEND examples tests/traps/uint64.cpp tests/traps/comparisons.cpp tests/traps/assignments.cpp)
    foreach(trap braces signed-numbers always-equal infinity milliseconds global-locale read-only-mark never-added
                 private-bases)
        list(APPEND examples examples/traps/${trap}.cpp=trap-${trap})
    endforeach()
    list(APPEND examples tests/traps/null-text.cpp=trap-null-text)
    ic_test_page(traps docs/traps.md ${examples})
endif()

set(example examples/testing)
ic_test_page(testing docs/testing.md ${example}/CMakeLists.txt ${example}/FanProvider.h ${example}/FanProvider.cpp ${example}/FanProvider_test.cpp)

# No page has programs that no test compiles, where all the examples are built.
if(IC_BUILD_EXAMPLES AND NOT IC_PLATFORM_DIR)
    file(GLOB_RECURSE pages RELATIVE ${PROJECT_SOURCE_DIR}
        ${PROJECT_SOURCE_DIR}/*.md)
    list(FILTER pages EXCLUDE REGEX "^build/")
    foreach(page IN LISTS pages)
        file(STRINGS ${PROJECT_SOURCE_DIR}/${page} programs REGEX "^```(cpp|cmake)")
        if(programs AND NOT page IN_LIST tested_pages)
            message(FATAL_ERROR "${page} shows programs, and no test looks at them")
        endif()
    endforeach()
endif()

# Installs the library, builds the consumer against it, runs it and compares what it prints.
#
#   BUILD          the build of the library that is installed
#   WORK           a folder of its own, emptied first
#   TIME           the consumer's date-time as the platform prints it
#   PLATFORM       set: the project in this folder is the platform; the library is first built on it
#   SOURCE         the source of the library, for PLATFORM
#   SHARED         whether the library is shared; if so, the plug-in is tried, too
#   GENERATOR      what to build every project with
#   SETTINGS       the file of cache variables to configure every project with
#   EMULATOR       the command that runs a program of another machine; empty for this one
file(REMOVE_RECURSE ${WORK})
set(prefix ${WORK}/moved)
set(configure ${CMAKE_COMMAND} -G ${GENERATOR} -C ${SETTINGS})

function(run)
    execute_process(COMMAND ${ARGN} OUTPUT_VARIABLE output ERROR_VARIABLE output RESULT_VARIABLE result)
    if(NOT result EQUAL 0)
        string(REPLACE ";" " " command "${ARGN}")
        message(FATAL_ERROR "${command}\n${output}")
    endif()
endfunction()

if(PLATFORM)
    run(${configure} -S ${PLATFORM} -B ${WORK}/platform-build)
    run(${CMAKE_COMMAND} --build ${WORK}/platform-build)
    run(${CMAKE_COMMAND} --install ${WORK}/platform-build --prefix ${WORK}/platform)
    set(BUILD ${WORK}/library-build)
    run(${configure} -S ${SOURCE} -B ${BUILD} -DBUILD_SHARED_LIBS=${SHARED}
        -DIC_PLATFORM_DIR=${WORK}/platform -DIC_BUILD_TESTS=OFF -DIC_BUILD_EXAMPLES=OFF -DIC_BUILD_TOOLS=OFF)
    run(${CMAKE_COMMAND} --build ${BUILD})
endif()

run(${CMAKE_COMMAND} --install ${BUILD} --prefix ${WORK}/installed)
file(RENAME ${WORK}/installed ${prefix})  # the installation is relocatable
file(GLOB_RECURSE stand_ins ${prefix}/*ZQ* ${prefix}/*VXLog* ${prefix}/ZQ/* ${prefix}/VXLog/*)
if(PLATFORM AND stand_ins)
    message(FATAL_ERROR "Stand-ins were installed beside the agent's own platform: ${stand_ins}")
endif()
if(PLATFORM)
    file(GLOB module_folder ${prefix}/*/pkgconfig)
    execute_process(COMMAND ${CMAKE_COMMAND} -E env PKG_CONFIG_PATH=${module_folder}
                            pkg-config --cflags --libs IC
                    OUTPUT_VARIABLE flags COMMAND_ERROR_IS_FATAL ANY)
    separate_arguments(flags UNIX_COMMAND "${flags}")
    set(missing -I${WORK}/platform/include -L${WORK}/platform/lib -lIC -lZQ)
    list(REMOVE_ITEM missing ${flags})
    if(missing)
        message(FATAL_ERROR "The pkg-config module lacks ${missing}; it has ${flags}")
    endif()
endif()

run(${configure} -S ${CMAKE_CURRENT_LIST_DIR} -B ${WORK}/build -DCMAKE_PREFIX_PATH=${prefix})
run(${CMAKE_COMMAND} --build ${WORK}/build)

configure_file(${CMAKE_CURRENT_LIST_DIR}/expected.txt ${WORK}/expected.txt @ONLY)
file(READ ${WORK}/expected.txt expected)
if(SHARED)
    set(plugin ${WORK}/build/libplugin.so)
    string(APPEND expected "from the plug-in: Can't return current value as a Number\n")
endif()
separate_arguments(emulator UNIX_COMMAND "${EMULATOR}")
execute_process(COMMAND ${emulator} ${WORK}/build/program ${plugin}
                OUTPUT_VARIABLE output ERROR_VARIABLE records RESULT_VARIABLE result)
if(NOT result EQUAL 0 OR NOT output STREQUAL expected)
    message(FATAL_ERROR "The consumer ended with ${result}\n${records}\nprinted\n${output}\ninstead of\n${expected}")
endif()

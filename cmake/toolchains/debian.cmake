# A machine for which Debian has a cross compiler, with its libraries in /usr/TRIPLET. The file that includes this one
# sets CMAKE_SYSTEM_PROCESSOR, `triplet` and, unless this machine runs the programs directly, `emulator`.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_C_COMPILER ${triplet}-gcc)
set(CMAKE_CXX_COMPILER ${triplet}-g++)
if(emulator)
    set(CMAKE_CROSSCOMPILING_EMULATOR ${emulator} -L /usr/${triplet})
endif()

# Programs of this machine, libraries and headers of the other, packages of either.
set(CMAKE_FIND_ROOT_PATH /usr/${triplet})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)

# Tools and tests that are not built or run for these machines.
set(IC_LEFT_OUT
    inventory     # hwloc, libsensors and umockdev are installed for this machine alone
    link_orders)  # the linker treats the order of objects alike on every machine
if(emulator)
    list(APPEND IC_LEFT_OUT
        MemoryLimit.KeepsTheOldValueWhenMemoryRunsOut   # the emulator ignores a program's own limits
        trap_assignments trap_comparisons trap_uint64)  # they only compile; i686 has them with its own sizes of types
endif()

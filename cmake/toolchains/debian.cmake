# A machine for which Debian has a cross compiler, with its libraries in /usr/TRIPLET. The file that includes this one
# has set CMAKE_SYSTEM_PROCESSOR, `triplet` and, unless the programs run here as they are, `emulator`.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_C_COMPILER ${triplet}-gcc)
set(CMAKE_CXX_COMPILER ${triplet}-g++)
if(emulator)
    set(CMAKE_CROSSCOMPILING_EMULATOR ${emulator} -L /usr/${triplet})
endif()

# Programs are those of this machine, libraries and headers those of the other; packages may lie anywhere.
set(CMAKE_FIND_ROOT_PATH /usr/${triplet})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)

# What is left out for these machines: tools, and tests by the names that CTest lists.
set(IC_LEFT_OUT
    inventory     # the libraries that it reads this machine with, and umockdev, are installed for this machine alone
    link_orders)  # links and starts programs by itself; an order of objects is the same for the linker everywhere
if(emulator)  # it grants its programs memory beyond any limit that they set themselves
    list(APPEND IC_LEFT_OUT MemoryLimit.KeepsTheOldValueWhenMemoryRunsOut)
endif()

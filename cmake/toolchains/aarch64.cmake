# 64 bits, little-endian; char is unsigned.
set(CMAKE_SYSTEM_PROCESSOR aarch64)
set(triplet aarch64-linux-gnu)
set(emulator qemu-aarch64)
include(${CMAKE_CURRENT_LIST_DIR}/debian.cmake)

# The tests that depend on the machine most, because emulation is slow. i686 needs no emulation and has every folder.
set(IC_TEST_FOLDERS classes model content CACHE STRING "The folders of tests/ that are built")

# A 32-bit PC without SSE. An x86-64 kernel runs its programs directly; they need the loader and the libraries of the
# cross compiler.
set(CMAKE_SYSTEM_PROCESSOR i686)
set(triplet i686-linux-gnu)
include(${CMAKE_CURRENT_LIST_DIR}/debian.cmake)
set(libraries /usr/${triplet}/lib)
set(CMAKE_EXE_LINKER_FLAGS_INIT "-Wl,--dynamic-linker=${libraries}/ld-linux.so.2 -Wl,-rpath,${libraries}")

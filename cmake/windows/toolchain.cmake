# 64-bit Windows from a Debian: mingw-w64's compiler with POSIX threads, programs run under wine.
set(CMAKE_SYSTEM_NAME Windows)
set(CMAKE_SYSTEM_PROCESSOR x86_64)
set(CMAKE_C_COMPILER x86_64-w64-mingw32-gcc-posix)
set(CMAKE_CXX_COMPILER x86_64-w64-mingw32-g++-posix)
set(CMAKE_RC_COMPILER x86_64-w64-mingw32-windres)
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE NEVER)

# CLI11, nlohmann-json and googletest come from Debian's packages for this machine: of their headers and sources nothing
# depends on the system, so the folder of this file has packages that take just these.
set(CLI11_DIR ${CMAKE_CURRENT_LIST_DIR})
set(nlohmann_json_DIR ${CMAKE_CURRENT_LIST_DIR})
set(GTest_DIR ${CMAKE_CURRENT_LIST_DIR})

set(CMAKE_CROSSCOMPILING_EMULATOR ${CMAKE_CURRENT_LIST_DIR}/run-windows-program)

# The appliance: 32-bit big-endian PowerPC, run here through qemu's user emulation. scripts/build-powerpc-deps.sh
# builds the target's libraries below QUOR_TARGET_PREFIX.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR powerpc)
set(CMAKE_LIBRARY_ARCHITECTURE powerpc-linux-gnu)
set(CMAKE_C_COMPILER powerpc-linux-gnu-gcc)
set(CMAKE_CXX_COMPILER powerpc-linux-gnu-g++)
set(CMAKE_CROSSCOMPILING_EMULATOR qemu-ppc -L /usr/powerpc-linux-gnu)

set(QUOR_TARGET_PREFIX ${CMAKE_CURRENT_LIST_DIR}/../build/powerpc-deps/prefix CACHE PATH "Libraries of the target")
cmake_path(ABSOLUTE_PATH QUOR_TARGET_PREFIX NORMALIZE)
set(CMAKE_FIND_ROOT_PATH ${QUOR_TARGET_PREFIX} /usr/powerpc-linux-gnu)
set(CMAKE_PREFIX_PATH ${QUOR_TARGET_PREFIX})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)
set(ENV{PKG_CONFIG_LIBDIR} ${QUOR_TARGET_PREFIX}/lib/pkgconfig)

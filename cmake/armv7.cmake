# Cross build for the target: ARMv7, hard float, Thumb-2, glibc.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR armv7l)
set(CMAKE_C_COMPILER arm-linux-gnueabihf-gcc)
set(CMAKE_CXX_COMPILER arm-linux-gnueabihf-g++)
set(CMAKE_C_FLAGS_INIT "-march=armv7-a -mfpu=vfpv3-d16 -mfloat-abi=hard -mthumb")
set(CMAKE_CXX_FLAGS_INIT "${CMAKE_C_FLAGS_INIT}")

set(KIV_ARMV7_SYSROOT /usr/arm-linux-gnueabihf CACHE PATH "Where the target's C library is, for the user-mode emulator")
set(CMAKE_CROSSCOMPILING_EMULATOR "qemu-arm;-L;${KIV_ARMV7_SYSROOT}")
set(CMAKE_FIND_ROOT_PATH ${KIV_ARMV7_SYSROOT})
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)

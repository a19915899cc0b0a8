# An ordinary Linux on a 32-bit board with hard floating point, as Debian's armhf.
set(arm_processor armv7)
set(arm_emulator qemu-arm)
set(arm_debian_architecture armhf)
set(arm_triplet arm-linux-gnueabihf)
set(arm_flags "-march=armv7-a+fp -mfloat-abi=hard")
include(${CMAKE_CURRENT_LIST_DIR}/toolchain-arm.cmake)

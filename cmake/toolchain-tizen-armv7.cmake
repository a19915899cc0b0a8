# A Tizen device: ARMv7, whose floating point unit is used inside functions only (softfp). The headers
# and libraries are an SDK's, -DCORESYSTEM_SYSROOT=FOLDER, or what tools/arm-sysroot puts together.
set(arm_processor armv7)
set(arm_emulator qemu-arm)
set(arm_debian_architecture armel)
set(arm_triplet arm-linux-gnueabi)
set(arm_flags "-march=armv7-a -mfloat-abi=softfp -mfpu=vfpv3-d16")
include(${CMAKE_CURRENT_LIST_DIR}/toolchain-arm.cmake)

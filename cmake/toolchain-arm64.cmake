# An ordinary Linux on a 64-bit phone or board, as Debian's arm64.
set(arm_processor aarch64)
set(arm_emulator qemu-aarch64)
set(arm_debian_architecture arm64)
set(arm_triplet aarch64-linux-gnu)
set(arm_flags "-march=armv8-a")
include(${CMAKE_CURRENT_LIST_DIR}/toolchain-arm.cmake)

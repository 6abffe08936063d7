# Cross-compiling for Linux on 64-bit ARM with Debian's compiler; programs run under qemu-user. The
# libraries are Debian's own packages for that architecture, side by side with the machine's.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR aarch64)
set(CMAKE_C_COMPILER aarch64-linux-gnu-gcc)
set(CMAKE_CXX_COMPILER aarch64-linux-gnu-g++)
set(CMAKE_LIBRARY_ARCHITECTURE aarch64-linux-gnu)

# A processor of the first generation, so that an instruction from a later one is found out here.
set(CMAKE_CROSSCOMPILING_EMULATOR qemu-aarch64 -cpu cortex-a57)

# How the daemon is built for a device: small, position independent, with every protection that the toolchain offers.
# Sanitizer builds leave the protections to the sanitizer.
add_library(kiv_hardening INTERFACE)
target_compile_options(kiv_hardening INTERFACE -ffunction-sections -fdata-sections -fvisibility=hidden)
if(NOT KIV_SANITIZE AND NOT CMAKE_BUILD_TYPE STREQUAL "Debug")
  target_compile_options(kiv_hardening INTERFACE -fstack-protector-strong -U_FORTIFY_SOURCE -D_FORTIFY_SOURCE=2)
  target_link_options(kiv_hardening INTERFACE LINKER:-z,relro LINKER:-z,now LINKER:-z,noexecstack LINKER:--gc-sections)
endif()
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
include(CheckPIESupported)
check_pie_supported(LANGUAGES CXX)

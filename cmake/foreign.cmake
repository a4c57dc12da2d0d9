# Toolchain for a machine that this one is not, built upon Debian's packages for that machine as
# packaging/foreign-root unpacks them in build/roots. OXMV_FOREIGN names it as Debian does:
#   i386     words of 32 bits; a processor of 64 runs its programs itself
#   s390x    big-endian; qemu-user runs its programs
set(CMAKE_TRY_COMPILE_PLATFORM_VARIABLES OXMV_FOREIGN)
if(OXMV_FOREIGN STREQUAL "i386")
  set(triple i686-linux-gnu)
  set(libraries i386-linux-gnu)
elseif(OXMV_FOREIGN STREQUAL "s390x")
  set(triple s390x-linux-gnu)
  set(libraries s390x-linux-gnu)
else()
  message(FATAL_ERROR "OXMV_FOREIGN is i386 or s390x, not '${OXMV_FOREIGN}'")
endif()
cmake_path(SET CMAKE_SYSROOT NORMALIZE "${CMAKE_CURRENT_LIST_DIR}/../build/roots/${OXMV_FOREIGN}")
if(NOT EXISTS "${CMAKE_SYSROOT}/content")
  message(FATAL_ERROR "${CMAKE_SYSROOT} is missing; unpack it with: "
    "packaging/foreign-root ${OXMV_FOREIGN} build/roots/${OXMV_FOREIGN}")
endif()

set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR ${OXMV_FOREIGN})
set(CMAKE_CXX_COMPILER ${triple}-g++-12)
set(CMAKE_LIBRARY_ARCHITECTURE ${libraries})

# Programs are this machine's, everything else is that one's.
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
foreach(kind IN ITEMS LIBRARY INCLUDE PACKAGE)
  set(CMAKE_FIND_ROOT_PATH_MODE_${kind} ONLY)
endforeach()
set(ENV{PKG_CONFIG_PATH} "")
set(ENV{PKG_CONFIG_SYSROOT_DIR} "${CMAKE_SYSROOT}")
set(ENV{PKG_CONFIG_LIBDIR} "${CMAKE_SYSROOT}/usr/lib/${libraries}/pkgconfig")

if(OXMV_FOREIGN STREQUAL "i386")
  string(JOIN "," flags -Wl
    "--dynamic-linker=${CMAKE_SYSROOT}/lib/ld-linux.so.2"
    --disable-new-dtags
    "-rpath=${CMAKE_SYSROOT}/lib/${libraries}:${CMAKE_SYSROOT}/usr/lib/${libraries}")
  set(CMAKE_EXE_LINKER_FLAGS_INIT "\"${flags}\"")
else()
  set(CMAKE_CROSSCOMPILING_EMULATOR qemu-${OXMV_FOREIGN} -L "${CMAKE_SYSROOT}")
endif()

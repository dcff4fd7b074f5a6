# Uses Debian's cross compiler for the architecture of the including file, with the libraries that .ci/sysroot fetches, or with
# those in DIR if called with -DCMAKE_SYSROOT=DIR.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_C_COMPILER ${CMAKE_LIBRARY_ARCHITECTURE}-gcc)
set(CMAKE_CXX_COMPILER ${CMAKE_LIBRARY_ARCHITECTURE}-g++)

if(NOT CMAKE_SYSROOT)
  get_filename_component(CMAKE_SYSROOT ../../build/sysroot/${CPACK_DEBIAN_PACKAGE_ARCHITECTURE} ABSOLUTE
    BASE_DIR ${CMAKE_CURRENT_LIST_DIR})
endif()
if(NOT EXISTS ${CMAKE_SYSROOT}/usr/include)
  message(FATAL_ERROR "The libraries of ${CPACK_DEBIAN_PACKAGE_ARCHITECTURE} are not in ${CMAKE_SYSROOT}. "
    "Run .ci/sysroot ${CPACK_DEBIAN_PACKAGE_ARCHITECTURE} first.")
endif()
# Searches libraries and packages only in the sysroot and CMAKE_FIND_ROOT_PATH, and programs only on the host.
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)
set(ENV{PKG_CONFIG_LIBDIR}
  ${CMAKE_SYSROOT}/usr/lib/${CMAKE_LIBRARY_ARCHITECTURE}/pkgconfig:${CMAKE_SYSROOT}/usr/share/pkgconfig)

find_program(KIV_EMULATOR qemu-${CMAKE_SYSTEM_PROCESSOR}-static DOC "Runs the target's programs")
if(KIV_EMULATOR)
  set(CMAKE_CROSSCOMPILING_EMULATOR ${KIV_EMULATOR} -L ${CMAKE_SYSROOT})
endif()

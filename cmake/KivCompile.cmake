# The compiler and linker options of every target. They do not depend on the paths of sources and build, so that two builds produce
# the same bytes.
set(CMAKE_BUILD_RPATH_USE_ORIGIN ON)

add_library(kiv_compile INTERFACE)
target_compile_options(kiv_compile INTERFACE
  -Wall -Wextra -Wpedantic -Wconversion -Wshadow -Werror
  -fstack-protector-strong
  "-ffile-prefix-map=${PROJECT_SOURCE_DIR}/=" "-ffile-prefix-map=${PROJECT_BINARY_DIR}=build"
  "$<$<BOOL:${CMAKE_SYSROOT}>:-ffile-prefix-map=${CMAKE_SYSROOT}=>")
# File sizes and times have 64 bits on 32-bit processors too, if the C library supports it.
target_compile_definitions(kiv_compile INTERFACE _FILE_OFFSET_BITS=64 _TIME_BITS=64)
target_link_options(kiv_compile INTERFACE -Wl,-z,relro,-z,now -Wl,-z,noexecstack -Wl,--as-needed)

# GCC notes on ARM that GCC 6 passed arguments differently, which is irrelevant here.
if(CMAKE_SYSTEM_PROCESSOR STREQUAL "arm")
  target_compile_options(kiv_compile INTERFACE -Wno-psabi)
endif()

if(KIV_SANITIZE)
  target_compile_options(kiv_compile INTERFACE -fsanitize=${KIV_SANITIZE} -fno-omit-frame-pointer -fno-sanitize-recover=all)
  target_link_options(kiv_compile INTERFACE -fsanitize=${KIV_SANITIZE})
else()
  target_link_options(kiv_compile INTERFACE -Wl,--no-undefined)
  # _FORTIFY_SOURCE needs optimisation; sanitizers check the same calls better.
  set(fortified $<NOT:$<OR:$<CONFIG:Debug>,$<BOOL:$<TARGET_PROPERTY:KIV_UNOPTIMIZED>>>>)
  target_compile_options(kiv_compile INTERFACE $<${fortified}:-U_FORTIFY_SOURCE$<SEMICOLON>-D_FORTIFY_SOURCE=2>)
endif()
# Tests are compiled more often than they run, and checks of the tests' own arithmetic would take half of the compile time.
set(unoptimized -O0 -g1)
if(KIV_SANITIZE MATCHES undefined)
  list(APPEND unoptimized -fno-sanitize=undefined)
endif()
target_compile_options(kiv_compile INTERFACE "$<$<BOOL:$<TARGET_PROPERTY:KIV_UNOPTIMIZED>>:${unoptimized}>")

# Shared libraries hide every symbol that is not exported by name.
function(kiv_shared_library target)
  add_library(${target} SHARED ${ARGN})
  target_link_libraries(${target} PRIVATE kiv_compile)
  set_target_properties(${target} PROPERTIES
    CXX_VISIBILITY_PRESET hidden
    VISIBILITY_INLINES_HIDDEN ON
    VERSION ${PROJECT_VERSION}
    SOVERSION ${PROJECT_VERSION_MAJOR}
    INSTALL_RPATH "$ORIGIN")
endfunction()

# Installs a shared library as a part of that component. find_package() provides kiv_system as kiv::system.
function(kiv_install_library target component)
  string(REPLACE kiv_ "" name ${target})
  set_property(TARGET ${target} PROPERTY EXPORT_NAME ${name})
  install(TARGETS ${target} EXPORT kiv_system
    LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR} COMPONENT ${component} NAMELINK_COMPONENT dev
    INCLUDES DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/kiv_system)
endfunction()

# Programs find the libraries relative to their own place, in any prefix.
function(kiv_program target)
  add_executable(${target} ${ARGN})
  target_link_libraries(${target} PRIVATE kiv_compile)
  set_target_properties(${target} PROPERTIES INSTALL_RPATH "$ORIGIN/../${CMAKE_INSTALL_LIBDIR}")
  install(TARGETS ${target} RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR} COMPONENT kivctl)
endfunction()

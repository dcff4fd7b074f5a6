add_library(kiv_test_operations STATIC sweep/Operations.cpp)
target_include_directories(kiv_test_operations PUBLIC ${CMAKE_CURRENT_SOURCE_DIR} ${PROJECT_SOURCE_DIR}/platform/simulated)
target_link_libraries(kiv_test_operations PRIVATE kiv_compile PUBLIC kiv_test_bus kiv_system ${CMAKE_DL_LIBS})
set_property(TARGET kiv_test_operations PROPERTY KIV_UNOPTIMIZED ON)

kiv_test(sweep_test sweep/Doubles.cpp sweep/Sweep.cpp sweep/platform_sweep.cpp sweep/memory_sweep.cpp
  sim/slots_test.cpp)
target_link_libraries(sweep_test PRIVATE kiv_test_operations)
target_compile_definitions(sweep_test PRIVATE KIV_EXPORTED_SYMBOLS="${PROJECT_SOURCE_DIR}/lib/DASystem/exported_symbols.txt")
kiv_test(threads_test sweep/threads_test.cpp)
target_link_libraries(threads_test PRIVATE kiv_test_operations)

# The allocators of the sanitizers keep no account of what is in use.
if(NOT KIV_SANITIZE)
  kiv_test(growth_test sweep/growth_test.cpp)
  target_link_libraries(growth_test PRIVATE kiv_test_operations)
  set_property(TEST growth_test APPEND PROPERTY ENVIRONMENT GLIBC_TUNABLES=glibc.malloc.tcache_count=0)
endif()

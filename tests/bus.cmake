add_library(kiv_test_bus STATIC support/Peer.cpp support/PrivateBus.cpp ${PROJECT_SOURCE_DIR}/bench/BusDaemon.cpp)
target_include_directories(kiv_test_bus PUBLIC ${CMAKE_CURRENT_SOURCE_DIR} ${PROJECT_SOURCE_DIR}/bench)
target_compile_definitions(kiv_test_bus PRIVATE KIV_PRIVATE_BUS_CONF="${PROJECT_SOURCE_DIR}/dbus/private-bus.conf")
target_link_libraries(kiv_test_bus PRIVATE kiv_compile PUBLIC GTest::gmock PkgConfig::GIO)
set_property(TARGET kiv_test_bus PROPERTY KIV_UNOPTIMIZED ON)

# Stores in memory instead of the support library's, for the programs that ask for them.
add_library(kiv_test_subscribers OBJECT bus/Subscribers.cpp)
target_link_libraries(kiv_test_subscribers PRIVATE kiv_compile kiv_util GTest::gmock PkgConfig::GIO Threads::Threads)
target_precompile_headers(kiv_test_subscribers REUSE_FROM kiv_test_headers)
set_target_properties(kiv_test_subscribers PROPERTIES KIV_UNOPTIMIZED ON POSITION_INDEPENDENT_CODE OFF UNITY_BUILD OFF)
target_include_directories(kiv_test_subscribers PRIVATE ${CMAKE_CURRENT_SOURCE_DIR})

foreach(subject IN ITEMS notification connection kill)
  kiv_test(bus_${subject}_test bus/${subject}_test.cpp $<TARGET_OBJECTS:kiv_test_subscribers>)
  target_link_libraries(bus_${subject}_test PRIVATE kiv_test_bus)
endforeach()
# A bus that dies at the wrong moment makes GDBus print a critical; the test itself fails on any other.
get_test_property(bus_kill_test ENVIRONMENT environment)
list(REMOVE_ITEM environment G_DEBUG=fatal-criticals)
set_tests_properties(bus_kill_test PROPERTIES ENVIRONMENT "${environment}")

add_test(NAME bus_policy COMMAND ${CMAKE_CURRENT_SOURCE_DIR}/bus/policy.sh $<TARGET_FILE:kivctl>
  ${PROJECT_SOURCE_DIR}/dbus/kiv-agent.conf)
set_tests_properties(bus_policy PROPERTIES TIMEOUT 120
  ENVIRONMENT "TSAN_OPTIONS=suppressions=${CMAKE_CURRENT_SOURCE_DIR}/tsan.supp atexit_sleep_ms=0")

# The messages of a notification and of a push are those of the loop that one would write first, and no other.
if(KIV_BUILD_BENCH)
  add_test(NAME bus_traffic COMMAND kiv_bench --only "messages on the bus")
  set_tests_properties(bus_traffic PROPERTIES TIMEOUT 120)
endif()

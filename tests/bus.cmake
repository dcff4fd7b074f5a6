add_library(kiv_test_bus STATIC support/Peer.cpp support/PrivateBus.cpp)
target_include_directories(kiv_test_bus PUBLIC ${CMAKE_CURRENT_SOURCE_DIR})
target_compile_definitions(kiv_test_bus PRIVATE KIV_PRIVATE_BUS_CONF="${PROJECT_SOURCE_DIR}/dbus/private-bus.conf")
target_link_libraries(kiv_test_bus PRIVATE kiv_compile PUBLIC GTest::gmock PkgConfig::GIO)
set_property(TARGET kiv_test_bus PROPERTY KIV_UNOPTIMIZED ON)

foreach(subject IN ITEMS notification outage connection)
  kiv_test(bus_${subject}_test bus/${subject}_test.cpp bus/Subscribers.cpp push/PushSubscribers.cpp)
  target_link_libraries(bus_${subject}_test PRIVATE kiv_test_bus)
endforeach()
target_link_libraries(bus_connection_test PRIVATE ${CMAKE_DL_LIBS})

# The allocators of the sanitizers keep no account of what is in use.
if(NOT KIV_SANITIZE)
  kiv_test(bus_growth_test bus/growth_test.cpp bus/Subscribers.cpp)
  target_link_libraries(bus_growth_test PRIVATE kiv_test_bus)
endif()

add_test(NAME bus_policy COMMAND ${CMAKE_CURRENT_SOURCE_DIR}/bus/policy.sh $<TARGET_FILE:kivctl>
  ${PROJECT_SOURCE_DIR}/dbus/kiv-agent.conf)
set_tests_properties(bus_policy PROPERTIES TIMEOUT 120
  ENVIRONMENT "TSAN_OPTIONS=suppressions=${CMAKE_CURRENT_SOURCE_DIR}/tsan.supp atexit_sleep_ms=0")

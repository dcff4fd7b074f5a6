kiv_test(push_test push/push_test.cpp $<TARGET_OBJECTS:kiv_test_subscribers>)
target_link_libraries(push_test PRIVATE kiv_test_bus)

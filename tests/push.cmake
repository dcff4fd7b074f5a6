kiv_test(push_test push/push_test.cpp bus/Subscribers.cpp)
target_link_libraries(push_test PRIVATE kiv_test_bus)

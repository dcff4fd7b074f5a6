kiv_test(push_test push/push_test.cpp push/PushSubscribers.cpp bus/Subscribers.cpp)
target_link_libraries(push_test PRIVATE kiv_test_bus)

# The allocators of the sanitizers keep no account of what is in use.
if(NOT KIV_SANITIZE)
  kiv_test(push_growth_test push/growth_test.cpp push/PushSubscribers.cpp bus/Subscribers.cpp)
  target_link_libraries(push_growth_test PRIVATE kiv_test_bus)
endif()

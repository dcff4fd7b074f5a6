kiv_test(kiv_util_test util/NamedLocks.cpp util/SubscriberStore.cpp)

kiv_test(platform_test platform/platform_test.cpp)

kiv_test(platform_test platform/device_test.cpp platform/changes_test.cpp)

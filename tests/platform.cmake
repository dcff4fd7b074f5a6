kiv_test(platform_test platform/handles_test.cpp platform/changes_test.cpp)

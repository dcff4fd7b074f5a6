kiv_test(device_test device/connection_test.cpp device/device_test.cpp device/language_test.cpp)
target_compile_definitions(device_test PRIVATE KIV_TEST_DATA="${CMAKE_CURRENT_SOURCE_DIR}/data")

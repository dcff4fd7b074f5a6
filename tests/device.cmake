kiv_test(device_test device/device_test.cpp)
kiv_test(language_test device/language_test.cpp)
target_compile_definitions(language_test PRIVATE KIV_TEST_DATA="${CMAKE_CURRENT_SOURCE_DIR}/data")

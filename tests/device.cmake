kiv_test(device_test device/connection_test.cpp device/device_test.cpp device/language_test.cpp)

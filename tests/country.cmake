kiv_test(country_test country/country_test.cpp)
target_compile_definitions(country_test PRIVATE KIV_TEST_DATA="${CMAKE_CURRENT_SOURCE_DIR}/data")

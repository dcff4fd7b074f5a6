kiv_test(connection_test connection/connection_test.cpp)

if(NOT KIV_SANITIZE)
  add_test(NAME client_service_cpp COMMAND ${CMAKE_CURRENT_SOURCE_DIR}/docs/client_service.sh ${PROJECT_BINARY_DIR}
    ${PROJECT_SOURCE_DIR} cpp ${CMAKE_CXX_COMPILER})
  set_tests_properties(client_service_cpp PROPERTIES TIMEOUT 120)
endif()
kiv_check(client_service_python ${CMAKE_CURRENT_SOURCE_DIR}/docs/client_service.sh ${PROJECT_BINARY_DIR} ${PROJECT_SOURCE_DIR} python)

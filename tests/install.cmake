# A sanitizer's runtime would have to come first in the agent, too.
if(NOT KIV_SANITIZE)
  add_test(NAME agent_from_readme COMMAND ${CMAKE_CURRENT_SOURCE_DIR}/install/agent_from_readme.sh ${PROJECT_BINARY_DIR}
    ${PROJECT_SOURCE_DIR}/README.md ${CMAKE_CXX_COMPILER})
  set_tests_properties(agent_from_readme PROPERTIES TIMEOUT 120)
endif()
kiv_check(packages ${CMAKE_CURRENT_SOURCE_DIR}/install/packages.sh ${PROJECT_BINARY_DIR} ${PROJECT_SOURCE_DIR}/README.md
  ${CMAKE_CXX_COMPILER})
kiv_check(native_build ${CMAKE_CURRENT_SOURCE_DIR}/install/native.sh ${PROJECT_BINARY_DIR} ${PROJECT_SOURCE_DIR}
  ${CMAKE_CXX_COMPILER})
kiv_check(same_bytes ${CMAKE_CURRENT_SOURCE_DIR}/install/same_bytes.sh ${PROJECT_BINARY_DIR} ${PROJECT_SOURCE_DIR})

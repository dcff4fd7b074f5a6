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

# Uses nothing of the library's by name, so that the linker leaves it out.
kiv_test(loading_test install/loading_test.cpp $<TARGET_OBJECTS:kiv_test_subscribers>)
target_link_libraries(loading_test PRIVATE kiv_test_bus ${CMAKE_DL_LIBS})
target_compile_definitions(loading_test PRIVATE KIV_LIBRARY="$<TARGET_FILE:kiv_system>")
set_property(TARGET loading_test PROPERTY ENABLE_EXPORTS ON)

# What the compiler's flags promise, read from what was built. The sanitizers watch the same things by
# themselves, and clang++ leaves out the calls of _FORTIFY_SOURCE that it can prove.
if(NOT KIV_SANITIZE AND CMAKE_CXX_COMPILER_ID STREQUAL GNU)
  add_test(NAME hardening COMMAND ${CMAKE_CURRENT_SOURCE_DIR}/install/hardening.sh ${CMAKE_READELF} $<TARGET_FILE:kiv_system>
    $<TARGET_FILE:kiv_util> $<TARGET_FILE:kiv_platform>)
endif()

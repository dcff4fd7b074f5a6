kiv_test(kivctl_test tools/kivctl_test.cpp)
target_link_libraries(kivctl_test PRIVATE kiv_test_bus)
target_compile_definitions(kivctl_test PRIVATE
  KIVCTL="$<TARGET_FILE:kivctl>"
  KIV_BOARD_DAEMON="$<TARGET_FILE:kiv-board-daemon>"
  KIV_SERVICE_MANAGER="$<TARGET_FILE:kiv-service-manager>"
  KIV_DOCS="${PROJECT_SOURCE_DIR}/docs"
  KIV_VERSION="${PROJECT_VERSION}")
# Many short-lived programs, each of which would sleep for a second at its end.
get_test_property(kivctl_test ENVIRONMENT environment)
list(TRANSFORM environment REPLACE "(TSAN_OPTIONS=.*)" "\\1 atexit_sleep_ms=0")
set_tests_properties(kivctl_test PROPERTIES ENVIRONMENT "${environment}")
add_dependencies(kivctl_test kivctl kiv-board-daemon kiv-service-manager)

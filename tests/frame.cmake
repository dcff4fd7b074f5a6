# The sanitizers put guard bytes behind a table and symbols of their own beside it.
if(NOT KIV_SANITIZE)
  add_test(NAME exported_symbols COMMAND ${CMAKE_COMMAND} -DNM=${CMAKE_NM} -DLIBRARY=$<TARGET_FILE:kiv_system>
    -DSYMBOLS=${PROJECT_SOURCE_DIR}/lib/DASystem/exported_symbols.txt
    -P ${CMAKE_CURRENT_SOURCE_DIR}/frame/exported_symbols.cmake)
endif()

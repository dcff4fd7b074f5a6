kiv_test(country_test country/country_test.cpp)

foreach(source IN ITEMS iso-codes libphonenumber mobile-broadband-provider-info)
  kiv_check(country_${source} ${CMAKE_CURRENT_SOURCE_DIR}/country/world.py ${source} ${CMAKE_CURRENT_SOURCE_DIR}/data)
endforeach()

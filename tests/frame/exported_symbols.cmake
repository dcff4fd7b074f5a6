# cmake -DNM=... -DLIBRARY=... -DSYMBOLS=... -P exported_symbols.cmake
# The library exports exactly the symbols of the list, and its classes have no virtual members except their destructors.
cmake_minimum_required(VERSION 3.21)
execute_process(COMMAND ${NM} --dynamic --defined-only --print-size --demangle ${LIBRARY} OUTPUT_VARIABLE output COMMAND_ERROR_IS_FATAL ANY)
string(REGEX REPLACE "[0-9a-f]+ ([0-9a-f]+ )?[A-Z] ([^\n]*)" "\\2" exported "${output}")
string(REGEX REPLACE "\n$" "" exported "${exported}")
string(REPLACE "\n" ";" exported "${exported}")
file(STRINGS ${SYMBOLS} listed)

# Offset to top, type information, two destructors: as many words as wide as the addresses in the output.
string(REGEX MATCH "^[0-9a-f]+" address "${output}")
string(LENGTH "${address}" digits)
math(EXPR size "4 * ${digits} / 2" OUTPUT_FORMAT HEXADECIMAL)
string(REPLACE 0x "" size ${size})

foreach(symbol IN LISTS exported)
  if(NOT symbol IN_LIST listed)
    message(SEND_ERROR "exported and not listed: ${symbol}")
  endif()
endforeach()
foreach(symbol IN LISTS listed)
  if(NOT symbol IN_LIST exported)
    message(SEND_ERROR "listed and not exported: ${symbol}")
  elseif(symbol MATCHES "^vtable for ")
    if(NOT output MATCHES " 0+${size} [A-Z] ${symbol}\n")
      message(SEND_ERROR "other virtual members than the destructor: ${symbol}")
    endif()
  endif()
endforeach()

# cmake -DNM=... -DLIBRARY=... -P exported_symbols.cmake
# The library exports the four classes and the listener and nothing else, and their destructors are their only virtual members.
execute_process(COMMAND ${NM} --dynamic --defined-only --print-size --demangle ${LIBRARY} OUTPUT_VARIABLE output COMMAND_ERROR_IS_FATAL ANY)
string(REPLACE "\n" ";" lines "${output}")

set(classes DASystem DASimManager DADBusManager DAConnectionManager)
list(JOIN classes "|" any)
foreach(line IN LISTS lines)
  if(line AND NOT line MATCHES " ([A-Z] (${any}|IDAConnectionStateListener)::|[DRV] (vtable|typeinfo|typeinfo name) for (${any}|IDAConnectionStateListener)$)")
    message(SEND_ERROR "exported without need: ${line}")
  endif()
endforeach()
foreach(class IN LISTS classes)
  # Offset to top, type information, two destructors.
  if(NOT output MATCHES " ${class}::GetInstance\\(\\)" OR NOT output MATCHES " ${class}::__pInstance\n")
    message(SEND_ERROR "${class} is not exported")
  elseif(NOT output MATCHES "0000000000000020 [A-Z] vtable for ${class}\n")
    message(SEND_ERROR "${class} has other virtual members than its destructor")
  endif()
endforeach()

# Joins the publisher's public keys into the one PEM text the program
# embeds; a signature by any of them counts.
#   cmake -P join_keys.cmake OUTPUT KEY.pem...
set(text "")
math(EXPR last "${CMAKE_ARGC} - 1")
foreach(index RANGE 4 ${last})
  set(key "${CMAKE_ARGV${index}}")
  file(READ "${key}" pem)
  if(NOT pem MATCHES "-----BEGIN PUBLIC KEY-----")
    message(FATAL_ERROR "${key} holds no PEM public key (make one with ironvale-patch keygen)")
  endif()
  string(APPEND text "${pem}\n")
endforeach()
file(WRITE "${CMAKE_ARGV3}" "${text}")

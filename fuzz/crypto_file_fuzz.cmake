# The reference key stream comes from OpenSSL directly.
foreach(program ${target} ${target}_replay)
  if(TARGET ${program})
    target_link_libraries(${program} PRIVATE OpenSSL::Crypto)
  endif()
endforeach()

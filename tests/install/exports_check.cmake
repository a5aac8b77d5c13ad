# Every exported, defined symbol belongs to namespace lodestack, or is one
# of the C++ library's weak template instantiations (std::, with or without a
# return type in front), or a linker or sanitizer symbol. The host build
# also implements the platform's own interfaces under the platform's names:
# the measurement library's classes, the location manager's and the secure
# storage's C functions.
execute_process(COMMAND nm -DC --defined-only ${LIBRARY}
  OUTPUT_VARIABLE symbols RESULT_VARIABLE rc)
if(NOT rc EQUAL 0)
  message(FATAL_ERROR "nm failed on ${LIBRARY}")
endif()
string(REPLACE "\n" ";" lines "${symbols}")
set(bad "")
set(public 0)
set(platform 0)
foreach(line ${lines})
  string(REGEX REPLACE "^[0-9a-f]+ [A-Za-z] " "" name "${line}")
  if(name MATCHES "lodestack::")
    math(EXPR public "${public} + 1")
    if(name MATCHES "lodestack::(detail|internal)::")
      list(APPEND bad "${name}")
    endif()
  elseif(name MATCHES "(^|[ *&])(std|__gnu_cxx)::" OR
         name MATCHES "^(operator new|operator delete|_init$|_fini$|__bss_start|_edata|_end$|__odr_asan|__asan|__ubsan|__sanitizer|__lsan|__tsan)")
    # The C++ library's own weak template instantiations; not ours to hide.
  elseif(name MATCHES "^(typeinfo|vtable|VTT|guard variable)")
  elseif(name MATCHES "^(RadioMeasurements|Oxel[A-Za-z]*)::" OR
         name MATCHES "^(location_manager_|ssa_)[a-z_]+$")
    math(EXPR platform "${platform} + 1")
  else()
    list(APPEND bad "${name}")
  endif()
endforeach()
if(bad)
  message(FATAL_ERROR "symbols outside the public API are exported:\n${bad}")
endif()
if(public LESS 10)
  message(FATAL_ERROR "only ${public} lodestack symbols exported")
endif()
message(STATUS "${public} public symbols and ${platform} platform symbols exported")

# Fails when an include points upward between the library's areas, or when a
# file outside an area includes one of that area's private headers.
#
# The layers, lowest first: core, stream, gom and debug; schema and math;
# the platform (it serves the radio adaptation); radioadaptation;
# measurements. crypto sits on core and stream and keeps its keys in the
# platform's secure storage (a C interface that needs nothing of the
# library), so the platform must not include crypto. An area may include its
# own layer and those below; the private headers of src/<area>/ (included as
# "<area>/...") belong to that area alone.
set(forbidden_core "schema|math|platform|radioadaptation|measurements|crypto")
set(forbidden_stream ${forbidden_core})
set(forbidden_gom ${forbidden_core})
set(forbidden_debug ${forbidden_core})
set(forbidden_schema "platform|radioadaptation|measurements|crypto")
set(forbidden_math ${forbidden_schema})
set(forbidden_crypto "schema|math|radioadaptation|measurements")
set(forbidden_platform "radioadaptation|measurements|crypto")
set(forbidden_radioadaptation "measurements")
set(forbidden_measurements "")

file(GLOB_RECURSE files RELATIVE ${SOURCE_DIR}
  ${SOURCE_DIR}/include/lodestack/*.h ${SOURCE_DIR}/src/*.h ${SOURCE_DIR}/src/*.cpp)
set(violations "")
foreach(file ${files})
  # The area: the folder under include/lodestack/ or src/.
  string(REGEX REPLACE "^(include/lodestack|src)/([^/]+)/.*" "\\2" area "${file}")
  if(area STREQUAL file)
    continue()  # lodestack.h includes everything by design
  endif()
  file(STRINGS ${SOURCE_DIR}/${file} includes REGEX "^[ \t]*#[ \t]*include[ \t]*\"")
  foreach(line ${includes})
    string(REGEX REPLACE "^[^\"]*\"([^\"]+)\".*" "\\1" target "${line}")
    if(target MATCHES "^lodestack/([^/]+)/")
      set(to ${CMAKE_MATCH_1})
      if(DEFINED forbidden_${area} AND NOT forbidden_${area} STREQUAL ""
         AND to MATCHES "^(${forbidden_${area}})$")
        list(APPEND violations "${file}: ${area} includes ${target}")
      endif()
    elseif(target MATCHES "^([^/]+)/" AND EXISTS ${SOURCE_DIR}/src/${target})
      set(to ${CMAKE_MATCH_1})
      if(NOT to STREQUAL area)
        list(APPEND violations "${file}: private header ${target} of ${to} used by ${area}")
      endif()
    endif()
  endforeach()
endforeach()
if(violations)
  string(REPLACE ";" "\n  " text "${violations}")
  message(FATAL_ERROR "includes against the layering:\n  ${text}")
endif()
list(LENGTH files count)
message(STATUS "${count} files follow the layering")

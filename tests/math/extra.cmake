# The geodesy tests compare with GeographicLib (a test-only dependency).
find_path(GEOGRAPHICLIB_INCLUDE_DIR GeographicLib/Geodesic.hpp REQUIRED)
find_library(GEOGRAPHICLIB_LIBRARY GeographicLib REQUIRED)
target_include_directories(lodestack_math_tests SYSTEM PRIVATE ${GEOGRAPHICLIB_INCLUDE_DIR})
target_link_libraries(lodestack_math_tests PRIVATE ${GEOGRAPHICLIB_LIBRARY})

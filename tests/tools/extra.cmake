# The tool's tests reach its printers and results file through its helper
# library, and run the built program as a child process; the geolocation
# tests also run the stand-in service and scenario beside them.
target_link_libraries(${target} PRIVATE lodestack_scan_core)
target_compile_definitions(${target} PRIVATE
  LODESTACK_SCAN_TOOL="$<TARGET_FILE:lodestack-scan>"
  LODESTACK_TOOL_TEST_DIR="${area_dir}")
add_dependencies(${target} lodestack-scan)
# The run against bus services mocks them on a private bus through GDBus.
target_link_libraries(${target} PRIVATE PkgConfig::GIO)

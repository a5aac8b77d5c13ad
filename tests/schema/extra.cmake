# The schema tests compare records' bytes with the checked-in fuzz seeds.
target_compile_definitions(lodestack_schema_tests PRIVATE
  LODESTACK_SOURCE_DIR="${PROJECT_SOURCE_DIR}")

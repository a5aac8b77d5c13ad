# The built-in street, made to answer at once, for the scenario case.
target_compile_definitions(measurement_path_bench PRIVATE
  LODESTACK_STREET_SCENARIO="${PROJECT_SOURCE_DIR}/data/scenarios/street.json")

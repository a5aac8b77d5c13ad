# The sample scenarios the end-to-end tests replay.
target_compile_definitions(${target} PRIVATE
  LODESTACK_SCENARIO_DIR="${PROJECT_SOURCE_DIR}/data/scenarios")

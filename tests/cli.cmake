# The lumeris command: conversions, argument parsing and output without a service, and the
# real programs against each other, with the generated completion and manual pages.
lumeris_add_gtest(cli_test
  SOURCES
    ${CMAKE_CURRENT_LIST_DIR}/cli/commands_test.cc
    ${CMAKE_CURRENT_LIST_DIR}/cli/items_output_test.cc
    ${CMAKE_CURRENT_LIST_DIR}/cli/json_value_test.cc
  LIBS lumeris_cli
  LABELS cli)

lumeris_add_gtest(cli_e2e_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/cli/cli_e2e_test.cc
  LIBS lumeris_message lumeris_plist nlohmann_json::nlohmann_json
  LABELS cli e2e)
target_compile_definitions(cli_e2e_test PRIVATE
  LUMERIS_TEST_FILESERVICE="$<TARGET_FILE:lumeris-fileservice>"
  LUMERIS_TEST_CLI="$<TARGET_FILE:lumeris_cli_program>"
  LUMERIS_TEST_REFERENCE_DIR="${PROJECT_BINARY_DIR}/reference")
add_dependencies(cli_e2e_test lumeris-fileservice lumeris_cli_program lumeris_reference)

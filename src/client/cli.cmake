# The lumeris command: the CLI11 app and its subcommands live in lumeris_cli (tests link it);
# the program is only main(). The program is named lumeris, like the module, so its target
# carries another name.
add_library(lumeris_cli STATIC
  ${CMAKE_CURRENT_LIST_DIR}/cli_app.cc
  ${CMAKE_CURRENT_LIST_DIR}/cli_channel.cc
  ${CMAKE_CURRENT_LIST_DIR}/cli_items.cc
  ${CMAKE_CURRENT_LIST_DIR}/cli_json_value.cc
  ${CMAKE_CURRENT_LIST_DIR}/cli_output.cc
  ${CMAKE_CURRENT_LIST_DIR}/cli_session.cc
  ${CMAKE_CURRENT_LIST_DIR}/cli_suggestion.cc
  ${CMAKE_CURRENT_LIST_DIR}/commands/category_command.cc
  ${CMAKE_CURRENT_LIST_DIR}/commands/demo_command.cc
  ${CMAKE_CURRENT_LIST_DIR}/commands/raw_command.cc
  ${CMAKE_CURRENT_LIST_DIR}/commands/search_commands.cc
  ${CMAKE_CURRENT_LIST_DIR}/commands/status_command.cc
  ${CMAKE_CURRENT_LIST_DIR}/commands/store_commands.cc
  ${CMAKE_CURRENT_LIST_DIR}/commands/viewer_command.cc)
target_link_libraries(lumeris_cli
  PUBLIC lumeris_client lumeris_cli_prefs lumeris_config lumeris_plist CLI11::CLI11 nlohmann_json::nlohmann_json
  PRIVATE lumeris lumeris_preferences lumeris_store lumeris_categories lumeris_system_root lumeris_data_notation
          ICU::uc)

add_executable(lumeris_cli_program ${CMAKE_CURRENT_LIST_DIR}/main.cc)
target_link_libraries(lumeris_cli_program PRIVATE lumeris_cli)
set_target_properties(lumeris_cli_program PROPERTIES
  OUTPUT_NAME lumeris
  RUNTIME_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/src/client)
install(TARGETS lumeris_cli_program RUNTIME DESTINATION ${CMAKE_INSTALL_BINDIR})

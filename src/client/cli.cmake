# The lumeris command: the CLI11 app and its subcommands live in lumeris_cli (tests link it);
# the program is only main(). The program is named lumeris, like the module, so its target
# carries another name.
add_library(lumeris_cli STATIC
  ${CMAKE_CURRENT_LIST_DIR}/cli_app.cc
  ${CMAKE_CURRENT_LIST_DIR}/cli_channel.cc
  ${CMAKE_CURRENT_LIST_DIR}/cli_items.cc
  ${CMAKE_CURRENT_LIST_DIR}/cli_json_value.cc
  ${CMAKE_CURRENT_LIST_DIR}/cli_output.cc
  ${CMAKE_CURRENT_LIST_DIR}/cli_reference.cc
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

# The manual pages and shell completions, written from the command-line definitions of lumeris
# and lumeris-fileservice (see cli_reference.h) into ${LUMERIS_REFERENCE_DIR}; packaging/
# installs them.
add_executable(lumeris-reference ${CMAKE_CURRENT_LIST_DIR}/reference_main.cc)
target_link_libraries(lumeris-reference PRIVATE lumeris_cli lumeris_service_command_line)
set(LUMERIS_REFERENCE_DIR ${PROJECT_BINARY_DIR}/reference)
set(LUMERIS_REFERENCE_FILES
  ${LUMERIS_REFERENCE_DIR}/lumeris.1 ${LUMERIS_REFERENCE_DIR}/lumeris-fileservice.8
  ${LUMERIS_REFERENCE_DIR}/lumeris.bash ${LUMERIS_REFERENCE_DIR}/_lumeris ${LUMERIS_REFERENCE_DIR}/lumeris.fish)
add_custom_command(
  OUTPUT ${LUMERIS_REFERENCE_FILES}
  COMMAND ${CMAKE_COMMAND} -E make_directory ${LUMERIS_REFERENCE_DIR}
  COMMAND ${CMAKE_COMMAND} -E env ASAN_OPTIONS=detect_leaks=0 $<TARGET_FILE:lumeris-reference> ${LUMERIS_REFERENCE_DIR}
  DEPENDS lumeris-reference
  COMMENT "Writing the manual pages and shell completions"
  VERBATIM)
add_custom_target(lumeris_reference ALL DEPENDS ${LUMERIS_REFERENCE_FILES})

# `lumeris defaults` and `lumeris watch`: library functions that register and run the two
# subcommands, so the lumeris program wires them in and tests call them directly; with them the
# tagged JSON notation every subcommand shares.
add_library(lumeris_cli_prefs STATIC
  cli_base64.cc defaults_command.cc json_notation.cc property_list_json.cc watch_command.cc)
target_link_libraries(lumeris_cli_prefs
  PUBLIC lumeris_config CLI11::CLI11 nlohmann_json::nlohmann_json lumeris_plist
  PRIVATE lumeris_preferences lumeris_notifications)

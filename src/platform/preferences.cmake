# The preference store: property-list files per domain and scope, flock-guarded synchronise.
add_library(lumeris_preferences STATIC
  preferences.cc preference_store.cc preferences_file_system.cc preferences_paths.cc)
set_target_properties(lumeris_preferences PROPERTIES POSITION_INDEPENDENT_CODE ON)
target_link_libraries(lumeris_preferences PUBLIC lumeris_plist lumeris_config Threads::Threads PRIVATE lumeris_log)

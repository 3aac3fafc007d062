# Tests of the platform stand-ins owned by the preferences area: property lists, the
# preference store and distributed notifications.
lumeris_add_gtest(property_list_test
  SOURCES platform/property_list_test.cc
  LIBS lumeris_plist
  LABELS platform)

lumeris_add_gtest(preference_store_test
  SOURCES platform/preference_store_test.cc
  LIBS lumeris_preferences
  LABELS platform)

lumeris_add_gtest(distributed_notifications_test
  SOURCES platform/distributed_notifications_test.cc
  LIBS lumeris_notifications
  LABELS platform dbus
  PRIVATE_BUS)

lumeris_add_gtest(defaults_command_test
  SOURCES platform/defaults_command_test.cc
  LIBS lumeris_cli_prefs lumeris_preferences lumeris_notifications
  LABELS platform dbus
  PRIVATE_BUS)

lumeris_add_gtest(binary_property_list_reader_test
  SOURCES platform/binary_property_list_reader_test.cc
  LIBS lumeris_plist
  LABELS platform)
add_dependencies(binary_property_list_reader_test lumeris_resources)
target_compile_definitions(binary_property_list_reader_test PRIVATE LUMERIS_TEST_BUILD_SYSTEM_ROOT="${LUMERIS_BUILD_SYSTEM_ROOT}")

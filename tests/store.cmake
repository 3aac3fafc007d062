# The user data store: unit tests on the store's functions with isolated preference files and a
# counting notification sink, and end-to-end tests through the real service.
lumeris_add_gtest(store_test
  SOURCES
    store/store_test.cc
    store/store_operations_test.cc
  LIBS lumeris_store
  LABELS store)

lumeris_add_gtest(store_e2e_test
  SOURCES store/store_e2e_test.cc
  LIBS lumeris_store lumeris_service_fixture lumeris_notifications lumeris_viewer_names
  LABELS store e2e dbus
  PRIVATE_BUS)

lumeris_add_gtest(large_viewer_e2e_test
  SOURCES store/large_viewer_e2e_test.cc
  LIBS lumeris_service_fixture lumeris_preferences lumeris_plist lumeris_store
  LABELS store e2e)

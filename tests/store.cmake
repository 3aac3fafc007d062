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
  LIBS lumeris_store lumeris_service_fixture lumeris_notifications
  LABELS store e2e dbus
  PRIVATE_BUS)

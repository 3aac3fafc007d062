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

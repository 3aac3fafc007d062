# The bundle reader, the user's languages and the system root; the category localization lookup.
lumeris_add_gtest(bundle_test
  SOURCES bundle/bundle_test.cc bundle/preferred_languages_test.cc
  LIBS lumeris_bundle lumeris_plist lumeris_system_root lumeris_preferred_languages
  LABELS bundle)
lumeris_add_gtest(categories_localization_test
  SOURCES categories/localization_lookup_test.cc
  LIBS lumeris_categories lumeris_system_root
  LABELS bundle)

# The character database: request rules on small databases, regional hiding, font coverage, and
# the three requests end to end on the real bundle.
lumeris_add_gtest(lumeris_database_test
  SOURCES
    ${CMAKE_CURRENT_LIST_DIR}/database/character_database_test.cc
    ${CMAKE_CURRENT_LIST_DIR}/categories/regional_restriction_test.cc
    ${CMAKE_CURRENT_LIST_DIR}/platform/font_coverage_test.cc
  LIBS lumeris_database lumeris_categories lumeris_font_coverage lumeris_preferences lumeris SQLite::SQLite3
  LABELS database)

lumeris_add_gtest(lumeris_database_e2e_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/database/database_e2e_test.cc
  LIBS lumeris_service_fixture lumeris_preferences lumeris
  LABELS database e2e)

# The indexed search and related characters against the reference rules on the real bundle.
# The reference reads the whole table per search, which the sanitizer build makes far too slow
# for the suite; the rules it compares are the same code in both builds, and the small-database
# rule tests run under both rules there.
if(NOT LUMERIS_SANITIZE)
  lumeris_add_gtest(lumeris_database_differential_test
    SOURCES ${CMAKE_CURRENT_LIST_DIR}/database/differential_test.cc
    LIBS lumeris_service_fixture lumeris_database lumeris_categories lumeris_font_coverage lumeris_preferences lumeris SQLite::SQLite3
    LABELS database)
endif()

lumeris_add_gtest(lumeris_search_index_table_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/database/search_index_table_test.cc
  LIBS lumeris_database SQLite::SQLite3
  LABELS database)

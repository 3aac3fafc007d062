# The category catalogue over bundles the tests write, and the "Data" notation.
lumeris_add_gtest(categories_catalogue_test
  SOURCES
    ${CMAKE_CURRENT_LIST_DIR}/categories/category_catalogue_test.cc
    ${CMAKE_CURRENT_LIST_DIR}/categories/data_notation_test.cc
  LIBS lumeris_categories lumeris_data_notation lumeris_plist
  LABELS categories)

lumeris_add_gtest(categories_catalogue_e2e_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/categories/catalogue_e2e_test.cc
  LIBS lumeris_categories lumeris_data_notation lumeris_plist lumeris_service_fixture
  LABELS categories e2e)
add_dependencies(categories_catalogue_e2e_test lumeris_resources)

lumeris_add_gtest(cli_category_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/cli/category_command_test.cc
  LIBS lumeris_cli lumeris_categories lumeris_plist
  LABELS cli categories)

# Resource builder: parser unit tests, and tests of the bundles the build wrote.
lumeris_add_gtest(resource_builder_test
  SOURCES resources/parsers_test.cc
  LIBS lumeris_resource_builder
  LABELS resources)

lumeris_add_gtest(resource_bundle_test
  SOURCES resources/bundle_test.cc
  LIBS lumeris_resource_builder lumeris_database lumeris_plist lumeris SQLite::SQLite3 ICU::uc
  LABELS resources)
add_dependencies(resource_bundle_test lumeris_resources)
target_compile_definitions(resource_bundle_test PRIVATE LUMERIS_TEST_BUILD_SYSTEM_ROOT="${LUMERIS_BUILD_SYSTEM_ROOT}")

# The picker's widgets on the test run's virtual X server, against the real service. The
# screenshots land in test-pictures/ of the build tree.
lumeris_add_gtest(lumeris_picker_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/picker/picker_test.cc
  LIBS lumeris_picker lumeris lumeris_service_fixture PkgConfig::XCB
  LABELS picker e2e
  PRIVATE_BUS SERIAL)
target_include_directories(lumeris_picker_test PRIVATE ${CMAKE_CURRENT_LIST_DIR}/picker)
target_compile_definitions(lumeris_picker_test PRIVATE
  LUMERIS_TEST_PICTURES="${CMAKE_BINARY_DIR}/test-pictures")

lumeris_add_gtest(lumeris_picker_model_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/picker/picker_model_test.cc
  LIBS lumeris_picker_model lumeris
  LABELS picker)

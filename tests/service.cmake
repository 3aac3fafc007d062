# The service core: message values, wire, conversions, dispatch, runtime, and the real program.

# What an end-to-end test needs: the service program built, its path, the raw-socket fixture.
add_library(lumeris_service_fixture INTERFACE)
target_link_libraries(lumeris_service_fixture INTERFACE lumeris_message lumeris_test_support)
target_compile_definitions(lumeris_service_fixture INTERFACE
  LUMERIS_TEST_FILESERVICE="$<TARGET_FILE:lumeris-fileservice>")
add_dependencies(lumeris_service_fixture lumeris-fileservice)

lumeris_add_gtest(lumeris_service_unit_test
  SOURCES
    ${CMAKE_CURRENT_LIST_DIR}/service/message_value_test.cc
    ${CMAKE_CURRENT_LIST_DIR}/service/wire_test.cc
    ${CMAKE_CURRENT_LIST_DIR}/service/dispatch_test.cc
  LIBS lumeris_service
  LABELS service)

lumeris_add_gtest(lumeris_service_runtime_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/service/server_test.cc
  LIBS lumeris_service lumeris_service_fixture
  LABELS service)

lumeris_add_gtest(lumeris_service_e2e_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/service/service_e2e_test.cc
  LIBS lumeris_service_fixture
  LABELS service e2e)
target_compile_definitions(lumeris_service_e2e_test PRIVATE
  LUMERIS_TEST_UNITS_DIR="${PROJECT_BINARY_DIR}/packaging/systemd")

lumeris_add_gtest(lumeris_client_test
  SOURCES ${CMAKE_CURRENT_LIST_DIR}/client/service_client_test.cc
  LIBS lumeris_client lumeris_service lumeris_service_fixture
  LABELS service client)

# The installed liblumeris is usable from outside the tree: the docs' panel example builds against
# an installed prefix with find_package(Lumeris) and with pkg-config (lumeris.pc).
# Not in the sanitizer build: an instrumented library needs an instrumented program.
if(NOT LUMERIS_SANITIZE)
  add_test(NAME lumeris_install_sdk
    COMMAND ${CMAKE_CURRENT_LIST_DIR}/packaging/install_sdk_test.sh ${CMAKE_BINARY_DIR}
            ${PROJECT_SOURCE_DIR}/docs/panel-example)
  set_tests_properties(lumeris_install_sdk PROPERTIES LABELS packaging TIMEOUT 300)
endif()

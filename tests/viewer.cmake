# Tests of liblumeris's panel helpers: font fitting and tinting (Pango, cairo), window capture and
# point conversion (on the test run's virtual X server), diagnostics and notification names.
# The drawing tests leave their pictures in test-pictures/ of the build tree.
lumeris_add_gtest(lumeris_panel_helpers_test
  SOURCES
    ${CMAKE_CURRENT_LIST_DIR}/categories/font_fitting_test.cc
    ${CMAKE_CURRENT_LIST_DIR}/viewer/panel_diagnostics_test.cc
    ${CMAKE_CURRENT_LIST_DIR}/viewer/window_test.cc
  LIBS lumeris
  LABELS viewer)
target_compile_definitions(lumeris_panel_helpers_test PRIVATE
  LUMERIS_TEST_PICTURES="${CMAKE_BINARY_DIR}/test-pictures")

# A directory that several areas share (src/platform, src/client, tests, bench, fuzz) keeps one
# CMake fragment per area, "<area>.cmake", and includes them all in name order.
macro(lumeris_include_fragments)
  file(GLOB _lumeris_fragments CONFIGURE_DEPENDS "${CMAKE_CURRENT_SOURCE_DIR}/*.cmake")
  list(SORT _lumeris_fragments)
  foreach(_fragment IN LISTS _lumeris_fragments)
    include("${_fragment}")
  endforeach()
endmacro()

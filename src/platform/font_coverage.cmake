# Font coverage: the colour emoji font name and "which font draws this string" (fontconfig, FreeType).
add_library(lumeris_font_coverage STATIC font_coverage.cc)
set_target_properties(lumeris_font_coverage PROPERTIES POSITION_INDEPENDENT_CODE ON)
target_link_libraries(lumeris_font_coverage
  PUBLIC lumeris_config ICU::uc
  PRIVATE lumeris_log Fontconfig::Fontconfig Freetype::Freetype)

# Resource bundles: Info.plist, localizations (matched with ICU), resource and strings lookup.
add_library(lumeris_bundle STATIC bundle.cc bundle_localization.cc)
set_target_properties(lumeris_bundle PROPERTIES POSITION_INDEPENDENT_CODE ON)
target_link_libraries(lumeris_bundle
  PUBLIC lumeris_config lumeris_plist lumeris_system_root lumeris_preferred_languages
  PRIVATE ICU::uc ICU::i18n)

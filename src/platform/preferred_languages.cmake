# The user's preferred languages and the current locale's country (ICU turns POSIX names into tags).
add_library(lumeris_preferred_languages STATIC preferred_languages.cc)
set_target_properties(lumeris_preferred_languages PROPERTIES POSITION_INDEPENDENT_CODE ON)
target_link_libraries(lumeris_preferred_languages PUBLIC lumeris_config PRIVATE ICU::uc)

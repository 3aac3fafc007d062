# The property-list value type and its binary/XML file I/O (libplist).
add_library(lumeris_plist STATIC property_list.cc property_list_io.cc
            binary_property_list_reader.cc)
set_target_properties(lumeris_plist PROPERTIES POSITION_INDEPENDENT_CODE ON)
target_link_libraries(lumeris_plist PUBLIC lumeris_config PRIVATE PkgConfig::PLIST ICU::uc)

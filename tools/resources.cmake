# The resource builder: a library (linked by the tests) and the lumeris-resource-builder program,
# which the build runs to write the resource bundles under ${LUMERIS_BUILD_SYSTEM_ROOT}.
set(LUMERIS_RESOURCE_BUILDER_SOURCES
  resource_builder/category_definitions.cc
  resource_builder/category_plists.cc
  resource_builder/character_db.cc
  resource_builder/character_info.cc
  resource_builder/cldr_annotations.cc
  resource_builder/cldr_labels.cc
  resource_builder/emoji_test.cc
  resource_builder/han_language_info.cc
  resource_builder/icons.cc
  resource_builder/input_files.cc
  resource_builder/related_chars.cc
  resource_builder/related_db.cc
  resource_builder/resource_build.cc
  resource_builder/sqlite_file.cc
  resource_builder/strings_tables.cc
  resource_builder/ucd_format.cc
  resource_builder/unicode_data.cc
  resource_builder/unihan.cc
  resource_builder/utf8.cc
  resource_builder/zhuyin.cc)

function(lumeris_add_resource_builder_library name)
  add_library(${name} STATIC ${LUMERIS_RESOURCE_BUILDER_SOURCES})
  target_include_directories(${name} PUBLIC ${CMAKE_CURRENT_SOURCE_DIR})
  target_link_libraries(${name}
    PUBLIC lumeris_plist lumeris_config lumeris_data_notation SQLite::SQLite3
    PRIVATE ICU::uc pugixml::pugixml BZip2::BZip2 PkgConfig::CAIRO PkgConfig::PANGO Threads::Threads)
endfunction()

# The library the tests link (instrumented in a sanitizer build).
lumeris_add_resource_builder_library(lumeris_resource_builder)

# The program the build runs. In a sanitizer build its own code is compiled without
# instrumentation (a second copy of the library), so a full run stays well under a minute; the
# sanitizers still check that code through the tests above.
add_executable(lumeris-resource-builder resource_builder/main.cc)
if(LUMERIS_SANITIZE)
  lumeris_add_resource_builder_library(lumeris_resource_builder_uninstrumented)
  target_compile_options(lumeris_resource_builder_uninstrumented PRIVATE -fno-sanitize=all -O2)
  target_compile_options(lumeris-resource-builder PRIVATE -fno-sanitize=all)
  target_link_libraries(lumeris-resource-builder PRIVATE lumeris_resource_builder_uninstrumented CLI11::CLI11)
else()
  target_link_libraries(lumeris-resource-builder PRIVATE lumeris_resource_builder CLI11::CLI11)
endif()

# Inputs: the Debian unicode-data and unicode-cldr-core files the builder reads.
set(LUMERIS_UNICODE_DIR /usr/share/unicode)
set(LUMERIS_CLDR_DIR /usr/share/unicode/cldr/common)
file(GLOB LUMERIS_CLDR_MAIN_FILES ${LUMERIS_CLDR_DIR}/main/*.xml)
set(LUMERIS_RESOURCE_INPUTS
  ${LUMERIS_UNICODE_DIR}/UnicodeData.txt
  ${LUMERIS_UNICODE_DIR}/NameAliases.txt
  ${LUMERIS_UNICODE_DIR}/Blocks.txt
  ${LUMERIS_UNICODE_DIR}/Scripts.txt
  ${LUMERIS_UNICODE_DIR}/Unihan_Readings.txt.bz2
  ${LUMERIS_UNICODE_DIR}/Unihan_DictionaryLikeData.txt.bz2
  ${LUMERIS_UNICODE_DIR}/Unihan_IRGSources.txt.bz2
  ${LUMERIS_UNICODE_DIR}/Unihan_Variants.txt.bz2
  ${LUMERIS_UNICODE_DIR}/emoji/emoji-test.txt
  ${LUMERIS_CLDR_DIR}/annotations/en.xml
  ${LUMERIS_CLDR_DIR}/annotationsDerived/en.xml
  ${LUMERIS_CLDR_DIR}/supplemental/supplementalData.xml
  ${LUMERIS_CLDR_MAIN_FILES}
  ${PROJECT_SOURCE_DIR}/LICENSES/Unicode-DFS-2016.txt)

# Stores the search index in the character database the builder wrote (the service reads it
# at start instead of scanning the whole table).
add_executable(lumeris-search-index-writer search_index/main.cc)
target_link_libraries(lumeris-search-index-writer PRIVATE lumeris_database)

# Reruns only when the builder or an input changes; the stamp is written last, so a failed step
# runs again. Leak checking is off for the run: the font libraries keep process-lifetime caches
# that a sanitizer build would report.
set(LUMERIS_RESOURCES_STAMP ${LUMERIS_BUILD_SYSTEM_ROOT}/.resources.stamp)
add_custom_command(
  OUTPUT ${LUMERIS_RESOURCES_STAMP}
  COMMAND ${CMAKE_COMMAND} -E make_directory ${LUMERIS_BUILD_SYSTEM_ROOT}
  COMMAND ${CMAKE_COMMAND} -E env ASAN_OPTIONS=detect_leaks=0
          $<TARGET_FILE:lumeris-resource-builder>
          --output ${LUMERIS_BUILD_SYSTEM_ROOT}
          --license ${PROJECT_SOURCE_DIR}/LICENSES/Unicode-DFS-2016.txt
          --unicode-dir ${LUMERIS_UNICODE_DIR}
          --cldr-dir ${LUMERIS_CLDR_DIR}
          --stamp ${LUMERIS_RESOURCES_STAMP}.partial
  COMMAND ${CMAKE_COMMAND} -E env ASAN_OPTIONS=detect_leaks=0
          $<TARGET_FILE:lumeris-search-index-writer>
          "${LUMERIS_BUILD_SYSTEM_ROOT}/System/Library/Input Methods/Sorvendi.app/Contents/Resources/CharacterDB.sqlite3"
  COMMAND ${CMAKE_COMMAND} -E rename ${LUMERIS_RESOURCES_STAMP}.partial ${LUMERIS_RESOURCES_STAMP}
  DEPENDS lumeris-resource-builder lumeris-search-index-writer ${LUMERIS_RESOURCE_INPUTS}
  COMMENT "Building the resource bundles under ${LUMERIS_BUILD_SYSTEM_ROOT}"
  VERBATIM)
add_custom_target(lumeris_resources ALL DEPENDS ${LUMERIS_RESOURCES_STAMP})

# Installed, the bundles live at the system root the programs use by default.
install(DIRECTORY ${LUMERIS_BUILD_SYSTEM_ROOT}/System
        DESTINATION ${CMAKE_INSTALL_DATADIR}/lumeris/root)

# search_relevance: how many words of a list show the expected character among the first five
# search results (see bench/README.md).
add_executable(search_relevance ${CMAKE_CURRENT_LIST_DIR}/search_relevance.cc)
target_link_libraries(search_relevance PRIVATE lumeris_client ICU::uc)
target_compile_definitions(search_relevance PRIVATE
  LUMERIS_BENCH_FILESERVICE="$<TARGET_FILE:lumeris-fileservice>"
  LUMERIS_BENCH_SYSTEM_ROOT="${LUMERIS_BUILD_SYSTEM_ROOT}"
  LUMERIS_BENCH_FONTCONFIG_FILE="${PROJECT_SOURCE_DIR}/packaging/fontconfig/60-lumeris-color-emoji.conf")
add_dependencies(search_relevance lumeris-fileservice lumeris_resources)

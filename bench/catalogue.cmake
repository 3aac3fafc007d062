# The category catalogue over the build's bundles, end to end and part by part: see bench/README.md.
add_executable(catalogue_bench ${CMAKE_CURRENT_LIST_DIR}/catalogue_bench.cc)
target_link_libraries(catalogue_bench PRIVATE
  lumeris_categories lumeris_client lumeris_message lumeris_plist lumeris_system_root benchmark::benchmark)
target_compile_definitions(catalogue_bench PRIVATE
  LUMERIS_BENCH_FILESERVICE="$<TARGET_FILE:lumeris-fileservice>"
  LUMERIS_BENCH_SYSTEM_ROOT="${LUMERIS_BUILD_SYSTEM_ROOT}"
  LUMERIS_BENCH_FONTCONFIG_FILE="${PROJECT_SOURCE_DIR}/packaging/fontconfig/60-lumeris-color-emoji.conf")
add_dependencies(catalogue_bench lumeris-fileservice lumeris_resources)

# database_bench: search, related characters and information records end to end on the real bundle.
add_executable(database_bench ${CMAKE_CURRENT_LIST_DIR}/database_bench.cc)
target_link_libraries(database_bench PRIVATE lumeris_client)
target_compile_definitions(database_bench PRIVATE
  LUMERIS_BENCH_FILESERVICE="$<TARGET_FILE:lumeris-fileservice>"
  LUMERIS_BENCH_SYSTEM_ROOT="${LUMERIS_BUILD_SYSTEM_ROOT}"
  LUMERIS_BENCH_FONTCONFIG_FILE="${PROJECT_SOURCE_DIR}/packaging/fontconfig/60-lumeris-color-emoji.conf"
  LUMERIS_BENCH_WORDS="${CMAKE_CURRENT_LIST_DIR}/data/search_words.txt")
add_dependencies(database_bench lumeris-fileservice)

# The user data store's round trips through the service: see bench/README.md.
add_executable(store_bench store_bench.cc)
target_link_libraries(store_bench PRIVATE lumeris_client lumeris_message lumeris_plist lumeris benchmark::benchmark)
target_compile_definitions(store_bench PRIVATE LUMERIS_BENCH_FILESERVICE="$<TARGET_FILE:lumeris-fileservice>"
                                               LUMERIS_BENCH_CLI="$<TARGET_FILE:lumeris_cli_program>"
                                               LUMERIS_BENCH_FONTCONFIG_FILE="${PROJECT_SOURCE_DIR}/packaging/fontconfig/60-lumeris-color-emoji.conf")
add_dependencies(store_bench lumeris-fileservice lumeris_cli_program)

# Localization lookup and bundle opening costs (see bench/README.md).
add_executable(localization_lookup_bench localization_lookup_bench.cc)
target_link_libraries(localization_lookup_bench PRIVATE lumeris_categories lumeris_bundle lumeris_plist benchmark::benchmark)

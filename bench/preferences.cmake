# The preference store and distributed notifications: see bench/README.md.
add_executable(preferences_bench preferences_bench.cc)
target_link_libraries(preferences_bench PRIVATE lumeris_preferences lumeris_notifications benchmark::benchmark)

# lumeris-picker: launch to first frame and keystroke to grid, on a scratch service; see bench/README.md.
add_executable(picker_bench picker_bench.cc)
target_link_libraries(picker_bench PRIVATE lumeris_picker lumeris_client benchmark::benchmark)
target_compile_definitions(picker_bench PRIVATE
  LUMERIS_BENCH_FILESERVICE="$<TARGET_FILE:lumeris-fileservice>"
  LUMERIS_BENCH_PICKER="$<TARGET_FILE:lumeris-picker>"
  LUMERIS_BENCH_SYSTEM_ROOT="${LUMERIS_BUILD_SYSTEM_ROOT}"
  LUMERIS_BENCH_FONTCONFIG_FILE="${PROJECT_SOURCE_DIR}/packaging/fontconfig/60-lumeris-color-emoji.conf")
add_dependencies(picker_bench lumeris-fileservice lumeris-picker)

# The text utilities and entity IDs: see bench/README.md.
add_executable(text_bench ${CMAKE_CURRENT_LIST_DIR}/text_bench.cc)
target_link_libraries(text_bench PRIVATE lumeris benchmark::benchmark)

# service_bench: latency, throughput and on-demand start of the real service.
add_executable(service_bench ${CMAKE_CURRENT_LIST_DIR}/service_bench.cc)
target_link_libraries(service_bench PRIVATE lumeris_client)
target_compile_definitions(service_bench PRIVATE
  LUMERIS_BENCH_FILESERVICE="$<TARGET_FILE:lumeris-fileservice>")
add_dependencies(service_bench lumeris-fileservice)

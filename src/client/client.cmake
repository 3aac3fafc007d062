# The client library: connects to the file service (starting it on demand) and exchanges
# messages with it. The lumeris command, the tests and the benchmarks build on it.
add_library(lumeris_client STATIC ${CMAKE_CURRENT_LIST_DIR}/service_client.cc)
set_target_properties(lumeris_client PROPERTIES POSITION_INDEPENDENT_CODE ON)
target_link_libraries(lumeris_client PUBLIC lumeris_message lumeris_config Threads::Threads PRIVATE PkgConfig::SYSTEMD)

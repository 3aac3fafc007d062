# Distributed notifications: a D-Bus session-bus signal posted and observed with sd-bus.
add_library(lumeris_notifications STATIC distributed_notifications.cc)
set_target_properties(lumeris_notifications PROPERTIES POSITION_INDEPENDENT_CODE ON)
target_link_libraries(lumeris_notifications PUBLIC lumeris_config PRIVATE PkgConfig::SYSTEMD Threads::Threads)

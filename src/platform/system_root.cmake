# The system root and the resolution of the system's absolute resource paths under it.
add_library(lumeris_system_root STATIC system_root.cc)
set_target_properties(lumeris_system_root PROPERTIES POSITION_INDEPENDENT_CODE ON)
target_link_libraries(lumeris_system_root PUBLIC lumeris_config)

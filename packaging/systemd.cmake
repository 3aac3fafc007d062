# systemd user units: the socket starts lumeris-fileservice on the first connection.
# The service unit names the installed program, so it is configured with the install path.
# Relative to the install prefix, so `cmake --install --prefix` moves the units with the programs;
# ExecStart names the program under the prefix chosen at configure time.
set(LUMERIS_SYSTEMD_USER_UNIT_DIR "lib/systemd/user"
    CACHE STRING "Where the systemd user units are installed, relative to the prefix")
set(LUMERIS_UNITS_DIR ${CMAKE_CURRENT_BINARY_DIR}/systemd)
configure_file(${CMAKE_CURRENT_LIST_DIR}/com.vantorel.Lumeris.FileService.service
               ${LUMERIS_UNITS_DIR}/com.vantorel.Lumeris.FileService.service @ONLY)
configure_file(${CMAKE_CURRENT_LIST_DIR}/com.vantorel.Lumeris.FileService.socket
               ${LUMERIS_UNITS_DIR}/com.vantorel.Lumeris.FileService.socket COPYONLY)
install(FILES ${LUMERIS_UNITS_DIR}/com.vantorel.Lumeris.FileService.service
              ${LUMERIS_UNITS_DIR}/com.vantorel.Lumeris.FileService.socket
        DESTINATION ${LUMERIS_SYSTEMD_USER_UNIT_DIR})

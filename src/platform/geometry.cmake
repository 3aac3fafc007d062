# Points and rectangles shared by the panel helpers of liblumeris; header-only, installed.
install(FILES geometry.h DESTINATION ${CMAKE_INSTALL_INCLUDEDIR}/lumeris/platform COMPONENT panel-sdk)

# The fontconfig file that makes "VantorelColorEmoji" name the installed colour emoji font.
install(FILES ${CMAKE_CURRENT_LIST_DIR}/fontconfig/60-lumeris-color-emoji.conf
        DESTINATION ${CMAKE_INSTALL_DATADIR}/lumeris/fontconfig)

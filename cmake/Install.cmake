# The folder of plug-ins is found relative to the shared library, the library relative to the programs.
set(VEXO_PLUGIN_DIR ${CMAKE_INSTALL_LIBDIR}/vexo/plugins)
install(TARGETS VexoMediaBrowser LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
install(DIRECTORY ${REELIX_BUNDLE} DESTINATION ${VEXO_PLUGIN_DIR} PATTERN "*.so" EXCLUDE)
install(TARGETS Reelix LIBRARY DESTINATION ${VEXO_PLUGIN_DIR}/Reelix.vxplugin/Contents/Linux)
install(FILES docs/vexo.1 DESTINATION ${CMAKE_INSTALL_MANDIR}/man1)

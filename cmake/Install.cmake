# The folder of plug-ins and the library that draws are found relative to the shared library, that one relative to
# the programs.
set(VEXO_PLUGIN_DIR ${CMAKE_INSTALL_LIBDIR}/vexo/plugins)
install(TARGETS VexoMediaBrowser LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
install(TARGETS VexoDrawing LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR}/vexo)
install(DIRECTORY ${REELIX_BUNDLE} DESTINATION ${VEXO_PLUGIN_DIR} PATTERN "*.so" EXCLUDE)
install(TARGETS Reelix LIBRARY DESTINATION ${VEXO_PLUGIN_DIR}/Reelix.vxplugin/Contents/Linux)
install(FILES docs/vexo.1 DESTINATION ${CMAKE_INSTALL_MANDIR}/man1)

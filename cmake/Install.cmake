# The installed folder of plug-ins is found relative to the shared library.
set(VEXO_PLUGIN_DIR ${CMAKE_INSTALL_LIBDIR}/vexo/plugins)
install(TARGETS VexoMediaBrowser LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
install(DIRECTORY ${CMAKE_BINARY_DIR}/Reelix.vxplugin DESTINATION ${VEXO_PLUGIN_DIR} USE_SOURCE_PERMISSIONS)

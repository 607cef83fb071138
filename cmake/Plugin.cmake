# The plug-in: its code as objects, which the tests link as well, and the bundle around the module.
file(GLOB PLUGIN_SOURCES CONFIGURE_DEPENDS core/*.cpp projects/*.cpp events/*.cpp watching/*.cpp browser/*.cpp)
add_library(reelix_objects OBJECT ${PLUGIN_SOURCES})
target_include_directories(reelix_objects PUBLIC ${CMAKE_SOURCE_DIR})
target_link_libraries(reelix_objects PRIVATE vexo_settings)
target_precompile_headers(reelix_objects PRIVATE cmake/Precompiled.h)
# What tests and fuzz targets link of it. Among the objects is the precompiled header, which is nothing to link.
set(REELIX_OBJECTS $<FILTER:$<TARGET_OBJECTS:reelix_objects>,EXCLUDE,[gp]ch$>)

set(REELIX_BUNDLE ${CMAKE_BINARY_DIR}/Reelix.vxplugin)
add_library(Reelix MODULE $<TARGET_OBJECTS:reelix_objects>)
target_link_libraries(Reelix PRIVATE vexo_settings VexoMediaBrowser)
# The module exports the one symbol that the host looks for, and nothing else.
target_link_options(Reelix PRIVATE LINKER:--version-script=${CMAKE_SOURCE_DIR}/cmake/plugin-exports.map)
set_target_properties(Reelix PROPERTIES PREFIX ""
    LIBRARY_OUTPUT_DIRECTORY ${REELIX_BUNDLE}/Contents/Linux
    LINK_DEPENDS ${CMAKE_SOURCE_DIR}/cmake/plugin-exports.map
    BUILD_WITH_INSTALL_RPATH ON)  # none: the host that loads the module has loaded the library
add_dependencies(Reelix reelix_resources)

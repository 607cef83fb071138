# Turns the table of file types into a source file, so that the library finds it wherever it is installed, and
# tells the library where the programs it starts lie.
set(FILE_TYPES_INI ${CMAKE_CURRENT_LIST_DIR}/file-types.ini)
set(FILE_TYPES_CPP ${CMAKE_BINARY_DIR}/generated/FileTypesText.cpp)
set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${FILE_TYPES_INI})
file(READ ${FILE_TYPES_INI} FILE_TYPES_TEXT)
file(CONFIGURE OUTPUT ${FILE_TYPES_CPP} @ONLY CONTENT [[
#include "framework/metadata/FileTypes.h"

namespace vexo {

const std::string_view fileTypesText = R"ini(@FILE_TYPES_TEXT@)ini";

}  // namespace vexo
]])
target_sources(VexoMediaBrowser PRIVATE ${FILE_TYPES_CPP})

file(RELATIVE_PATH PROGRAMS_FROM_LIBRARY ${CMAKE_INSTALL_FULL_LIBDIR} ${CMAKE_INSTALL_FULL_LIBEXECDIR}/vexo)
set_source_files_properties(framework/metadata/ReaderProgram.cpp PROPERTIES
    COMPILE_DEFINITIONS VEXO_PROGRAMS_FROM_LIBRARY="${PROGRAMS_FROM_LIBRARY}")

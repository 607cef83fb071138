# vexo_embed(TARGET FUNCTION BASE file…) compiles files into a target, so that they need not be found at run time.
#
# Adds to TARGET a source file that defines FUNCTION, a qualified name such as vexo::frameworkResource, for a header
# of the target to declare:
#     std::optional<std::string_view> FUNCTION(std::string_view name);
# It answers the bytes of the file that has that path relative to the folder BASE, and nil for any other name.
#
# The same file is the script that the build runs to write that source file.
if(NOT CMAKE_SCRIPT_MODE_FILE)
    set(VEXO_EMBED_SCRIPT ${CMAKE_CURRENT_LIST_FILE})

    function(vexo_embed target function base)
        string(REPLACE "::" "_" stem ${function})
        set(source ${CMAKE_CURRENT_BINARY_DIR}/embedded/${stem}.cpp)
        add_custom_command(OUTPUT ${source}
            COMMAND ${CMAKE_COMMAND} -DFUNCTION=${function} -DBASE=${base} -DSOURCE=${source} "-DFILES=${ARGN}"
                    -P ${VEXO_EMBED_SCRIPT}
            DEPENDS ${ARGN} ${VEXO_EMBED_SCRIPT} VERBATIM)
        target_sources(${target} PRIVATE ${source})
    endfunction()
    return()
endif()

set(arrays "")
set(entries "")
set(number 0)
foreach(path IN LISTS FILES)
    file(RELATIVE_PATH name ${BASE} ${path})
    file(READ ${path} bytes HEX)
    string(REGEX REPLACE "(..)" "0x\\1," bytes "${bytes}")
    string(REPLACE "0x0a," "0x0a,\n" bytes "${bytes}")
    math(EXPR number "${number} + 1")
    # The final NUL keeps the array of an empty file legal; it does not count.
    string(APPEND arrays "const unsigned char file${number}[] = {\n${bytes}0};\n\n")
    string(APPEND entries "    if (name == \"${name}\")\n        return contentsOf(file${number});\n")
endforeach()

string(FIND ${FUNCTION} "::" separator REVERSE)
string(SUBSTRING ${FUNCTION} 0 ${separator} namespace)
math(EXPR separator "${separator} + 2")
string(SUBSTRING ${FUNCTION} ${separator} -1 function)
file(CONFIGURE OUTPUT ${SOURCE} @ONLY CONTENT [[
#include <cstddef>
#include <optional>
#include <string_view>

namespace {

template <std::size_t size>
std::string_view contentsOf(const unsigned char (&bytes)[size]) {
    return {reinterpret_cast<const char*>(bytes), size - 1};
}

@arrays@}  // namespace

namespace @namespace@ {

std::optional<std::string_view> @function@(std::string_view name) {
@entries@    return std::nullopt;
}

}  // namespace @namespace@
]])

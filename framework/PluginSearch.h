// Where plug-in bundles are looked for.
#pragma once

#include <string>
#include <vector>

namespace vexo {

// The bundles to open, in order: those named in `explicitBundles` alone when there are any, else every
// *.vxplugin in the folders of VEXO_PLUGIN_PATH (separated by colons), the build tree's own bundle when the
// host runs from a build tree, and those in $XDG_DATA_HOME/vexo/plugins and the installed folder.
std::vector<std::string> pluginBundles(const std::vector<std::string>& explicitBundles);

}  // namespace vexo

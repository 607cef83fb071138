// The commands of vexo. Each writes its answer to `out` and answers what went wrong, nil when nothing did.
#pragma once

#include <optional>
#include <ostream>
#include <string>

#include "framework/Host.h"

namespace vexo {

enum class OutputFormat { text, json };

// What is wrong, and where there is something, what to do about it. One line.
using Problem = std::optional<std::string>;

struct TreeOptions {
    OutputFormat format = OutputFormat::text;
    bool withMetadata = false;  // read every movie's metadata
    std::optional<int> depth;   // levels below the root; nil for all
};

Problem runTree(Host& host, const TreeOptions& options, std::ostream& out);
Problem runInfo(Host& host, OutputFormat format, std::ostream& out);
Problem runLocations(Host& host, OutputFormat format, std::ostream& out);
// Needs no host: writes a sample home into `folder`.
Problem runDemo(const std::string& folder, std::ostream& out);

}  // namespace vexo

// The commands of vexo. Each writes its answer to `out` and answers what went wrong.
#pragma once

#include <chrono>
#include <optional>
#include <ostream>
#include <string>
#include <vector>

#include "framework/Host.h"
#include "framework/queries/QueryExpression.h"
#include "platform/Value.h"

namespace vexo {

enum class OutputFormat { text, json };

// What is wrong, and where there is something, what to do about it. One line.
using Problem = std::optional<std::string>;
// Of a command that goes on after a problem with one of several things; empty when all went well.
using Problems = std::vector<std::string>;

struct TreeOptions {
    OutputFormat format = OutputFormat::text;
    bool withMetadata = false;  // read every movie's metadata
    std::optional<int> depth;   // levels below the root; nil for all
};

struct InfoOptions {
    OutputFormat format = OutputFormat::text;
    bool withMediaReader = false;  // start the program that reads movies and ask what it has given up
};

struct WatchOptions {
    OutputFormat format = OutputFormat::text;
    std::optional<std::chrono::duration<double>> time;  // to stay after the first tree; nil for ever
};

struct QueryOptions {
    OutputFormat format = OutputFormat::text;
    QueryExpression expression;
    std::vector<std::string> folders;
    bool watches = false;  // stays, and prints the results again after each change
};

struct MenuOptions {
    std::optional<std::string> object;  // an ID or URL; of this one
    std::optional<std::string> group;   // or that one
    std::optional<int> chosenEntry;     // to perform, from 1; nil to print the menu
    OutputFormat format = OutputFormat::text;
};

struct OverlayOptions {
    std::string object;      // an ID or URL
    platform::Size size;     // in points
    double scale = 1;        // pixels a point
    std::string outputFile;  // for the PNG
};

// Of the items or of the groups; one of the lists is empty.
struct CopyOptions {
    std::vector<std::string> objects;  // IDs or URLs
    std::vector<std::string> groups;
    OutputFormat format = OutputFormat::text;
    std::optional<std::string> type;        // whose bytes alone are written
    std::optional<std::string> outputFile;  // nil for the output
};

Problems runTree(Host& host, const TreeOptions& options, std::ostream& out);
Problems runInfo(Host& host, const InfoOptions& options, std::ostream& out);
Problems runLocations(Host& host, OutputFormat format, std::ostream& out);
// Requires: the host follows changes. Stays until SIGINT or SIGTERM, or until the time is over.
Problems runWatch(Host& host, const WatchOptions& options, std::ostream& out);
// Performing an entry prints nothing.
Problems runMenu(Host& host, const MenuOptions& options, std::ostream& out);
Problems runOverlay(Host& host, const OverlayOptions& options);
Problems runCopy(Host& host, const CopyOptions& options, std::ostream& out);
// These need no plug-in.
Problems runMetadata(Host& host, const std::vector<std::string>& files, OutputFormat format,
                     std::ostream& out);
Problems runQuery(Host& host, QueryOptions options, std::ostream& out);
// Needs no host: writes a sample home into `folder`.
Problems runDemo(const std::string& folder, std::ostream& out);

}  // namespace vexo

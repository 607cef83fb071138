#include <fmt/format.h>

#include "apps/vexo/Commands.h"
#include "apps/vexo/DemoHome.h"
#include "apps/vexo/Terminal.h"

namespace vexo {
namespace {

// As a shell takes it for one word.
std::string quotedForShell(const std::string& text) {
    constexpr std::string_view harmless =
        "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789/._-+,:@%";
    if (text.find_first_not_of(harmless) == std::string::npos)
        return text;
    std::string quoted = "'";
    for (const char c : text)
        quoted += c == '\'' ? std::string("'\\''") : std::string(1, c);
    return quoted + "'";
}

void print(const DemoHome& home, std::ostream& out) {
    out << fmt::format(
        "Made a sample home in {}: {} projects, {} of them trailers, and {} events, with {} movies "
        "({:.1f} MB).\n",
        printable(home.folder), home.projects, home.trailers, home.events, home.movies,
        static_cast<double>(home.bytes) / 1e6);
    if (!home.keepsAttributes)
        out << "This file system keeps no extended attributes: clips dated by one show other dates.\n";
    out << fmt::format("Look at it with:\n  vexo --home {} tree\n", printable(quotedForShell(home.folder)));
}

}  // namespace

Problems runDemo(const std::string& folder, std::ostream& out) {
    const DemoHomeResult made = makeDemoHome(folder, DemoMovieMaker());
    if (!made.home)
        return {printable(made.error)};  // stays one line whatever the folder is called
    print(*made.home, out);
    return {};
}

}  // namespace vexo

#include "platform/Path.h"

#include "platform/FileManager.h"
#include "platform/Services.h"

namespace platform::path {

namespace {

constexpr auto none = std::string_view::npos;

// "/" keeps its only slash.
std::string_view withoutTrailingSlashes(std::string_view path) {
    const std::size_t last = path.find_last_not_of('/');
    if (last == none)
        return path.substr(0, 1);
    return path.substr(0, last + 1);
}

std::string_view withoutLeadingSlashes(std::string_view path) {
    const std::size_t first = path.find_first_not_of('/');
    return first == none ? std::string_view() : path.substr(first);
}

std::string_view lastComponentView(std::string_view path) {
    const std::string_view trimmed = withoutTrailingSlashes(path);
    if (trimmed == "/")
        return trimmed;
    return trimmed.substr(trimmed.rfind('/') + 1);
}

// The extension with its dot; empty when there is none. Looked for from the end, where it is: paths are long.
std::string_view dottedExtension(std::string_view path) {
    const std::string_view trimmed = withoutTrailingSlashes(path);
    const std::size_t dot = trimmed.rfind('.');
    if (dot == none || dot == 0 || trimmed[dot - 1] == '/' || dot + 1 == trimmed.size())
        return {};
    const std::string_view dotted = trimmed.substr(dot);
    return dotted.find('/') == none ? dotted : std::string_view();
}

}  // namespace

std::string lastComponent(std::string_view path) {
    return std::string(lastComponentView(path));
}

std::string withoutLastComponent(std::string_view path) {
    const std::string_view trimmed = withoutTrailingSlashes(path);
    const std::size_t slash = trimmed.rfind('/');
    if (slash == none)
        return {};
    return std::string(withoutTrailingSlashes(trimmed.substr(0, slash + 1)));
}

std::string appending(std::string_view path, std::string_view component) {
    if (path.empty())
        return std::string(withoutTrailingSlashes(component));
    const std::string_view head = withoutTrailingSlashes(path);
    const std::string_view tail = withoutLeadingSlashes(withoutTrailingSlashes(component));
    std::string longer;
    longer.reserve(head.size() + 1 + tail.size());
    longer = head;
    if (!tail.empty() && head != "/")
        longer += '/';
    longer += tail;
    return longer;
}

std::string extension(std::string_view path) {
    const std::string_view dotted = dottedExtension(path);
    return std::string(dotted.empty() ? dotted : dotted.substr(1));
}

std::string withoutExtension(std::string_view path) {
    return std::string(withoutExtensionView(path));
}

std::string_view withoutExtensionView(std::string_view path) {
    std::string_view trimmed = withoutTrailingSlashes(path);
    trimmed.remove_suffix(dottedExtension(trimmed).size());
    return trimmed;
}

std::string appendingExtension(std::string_view path, std::string_view extension) {
    std::string longer(withoutTrailingSlashes(path));
    if (longer.empty() || longer == "/" || extension.empty())
        return longer;
    longer.append(".").append(extension);
    return longer;
}

std::vector<std::string> components(std::string_view path) {
    std::vector<std::string> found;
    if (path.starts_with('/'))
        found.emplace_back("/");
    for (std::string_view rest = withoutLeadingSlashes(path); !rest.empty();) {
        const std::size_t end = std::min(rest.find('/'), rest.size());
        found.emplace_back(rest.substr(0, end));
        rest = withoutLeadingSlashes(rest.substr(end));
    }
    return found;
}

std::string expandingTilde(std::string_view path) {
    if (path != "~" && !path.starts_with("~/"))
        return std::string(path);
    const std::optional<std::string> home = services().fileManager.homeDirectory();
    if (!home || home->empty())
        return std::string(path);
    return appending(*home, path.substr(1));
}

}  // namespace platform::path

// The file URL of a path. Percent-encoding keeps every byte of the path, also those that are not UTF-8.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace platform {

class URL {
  public:
    // Requires: `path` is absolute; a relative one is taken as it stands.
    static URL fileURLWithPath(std::string path) { return URL(std::move(path)); }
    // The path that a "file:///…" or "file://localhost/…" URL names, without slashes at its end. nil for any
    // other text: other schemes and hosts, a query or fragment, a damaged escape, and escapes of NUL and of
    // "/", which no file name can hold. Bytes that should have been escaped and are not stand for themselves.
    static std::optional<URL> fileURLWithString(std::string_view text);

    const std::string& path() const { return path_; }
    // "file:///a/b", no slash at the end of a folder. One path has one text, the one that other programs of
    // the desktop use as well.
    std::string absoluteString() const;

    bool operator==(const URL&) const = default;

  private:
    explicit URL(std::string path) : path_(std::move(path)) {}
    std::string path_;
};

}  // namespace platform

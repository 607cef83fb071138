// Path strings: pure text, no file is touched. Paths are bytes, separated by "/", and need not be UTF-8.
//
// The rules for odd names are the platform's: a last "." with nothing after it makes no extension ("a."),
// nor does one with nothing before it (".qnproject"); an extension may hold any byte, blanks included
// ("a.b c" -> "b c"); trailing slashes do not count and are not kept; "/" is its own last component.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace platform::path {

// "/a/b.mov/" -> "b.mov", "/" -> "/", "" -> ""
std::string lastComponent(std::string_view path);
// "/a/b" -> "/a", "/a" -> "/", "a" -> "", "/" -> "/"
std::string withoutLastComponent(std::string_view path);
// Exactly one "/" between the two; an empty path or component adds nothing.
std::string appending(std::string_view path, std::string_view component);

std::string extension(std::string_view path);         // "x.tar.mov" -> "mov", "a." -> "", ".mov" -> ""
std::string withoutExtension(std::string_view path);  // "/a/x.tar.mov" -> "/a/x.tar", ".mov" -> ".mov"
std::string_view withoutExtensionView(std::string_view path);  // the same, a part of `path`
// "/a/b/", "localized" -> "/a/b.localized"; an empty extension adds nothing, nor is anything added to a path
// without a name ("", "/").
std::string appendingExtension(std::string_view path, std::string_view extension);

// "/a//b/" -> {"/", "a", "b"}; the empty path has none.
std::vector<std::string> components(std::string_view path);

// A leading "~" becomes the current user's home directory (FileManager::homeDirectory), where there is one.
// Forms that name another user ("~name/…") are left alone.
std::string expandingTilde(std::string_view path);

}  // namespace platform::path

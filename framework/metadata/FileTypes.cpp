#include "framework/metadata/FileTypes.h"

#include <algorithm>
#include <sstream>

#include "platform/Path.h"

namespace vexo {

namespace {

constexpr std::string_view blanks = " \t\r";

std::string_view trimmed(std::string_view text) {
    const auto first = text.find_first_not_of(blanks);
    if (first == std::string_view::npos)
        return {};
    return text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

std::vector<std::string> words(std::string_view text) {
    std::istringstream stream{std::string(text)};
    std::vector<std::string> found;
    for (std::string word; stream >> word;)
        found.push_back(word);
    return found;
}

// Extensions are plain ASCII; other bytes of a name stay as they are and match nothing.
std::string lowerCase(std::string_view text) {
    std::string lower(text);
    for (char& c : lower)
        c = c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    return lower;
}

bool contains(const std::vector<std::string>& list, std::string_view text) {
    return std::find(list.begin(), list.end(), text) != list.end();
}

void markByAncestors(FileType& type) {
    type.isPackage = contains(type.contentTypeTree, "com.norvale.package");
    type.isSound = contains(type.contentTypeTree, "public.audio");
    // MPEG-4 audio is a special case of MPEG-4 as well.
    type.isMovie = contains(type.contentTypeTree, "public.movie") && !type.isSound;
}

}  // namespace

struct FileTypeTable::Section {
    std::string contentType;
    std::string kind;
    std::vector<std::string> parents;
    std::vector<std::string> extensions;
    std::vector<std::string> mimes;
};

FileTypeTable::FileTypeTable(std::string_view iniText) {
    const auto sections = sectionsOf(iniText);
    addTypes(sections);
    for (const Section& section : sections) {
        addExtensions(section);
        addMimes(section);
    }
}

const FileTypeTable& FileTypeTable::shared() {
    static const FileTypeTable table(fileTypesText);
    return table;
}

std::vector<FileTypeTable::Section> FileTypeTable::sectionsOf(std::string_view iniText) {
    std::vector<Section> sections;
    std::istringstream lines{std::string(iniText)};
    for (std::string text; std::getline(lines, text);) {
        const std::string_view line = trimmed(text);
        if (line.empty() || line.front() == '#')
            continue;
        if (line.front() == '[' && line.back() == ']')
            sections.push_back({std::string(line.substr(1, line.size() - 2)), {}, {}, {}, {}});
        else if (sections.empty())
            problems_.push_back("before the first section: " + text);
        else
            readEntry(sections.back(), line);
    }
    return sections;
}

void FileTypeTable::readEntry(Section& section, std::string_view line) {
    const auto equals = line.find('=');
    const std::string_view key = trimmed(line.substr(0, equals));
    const std::string_view value =
        equals == line.npos ? std::string_view() : trimmed(line.substr(equals + 1));
    if (key == "kind")
        section.kind = value;
    else if (key == "parents")
        section.parents = words(value);
    else if (key == "extensions")
        section.extensions = words(value);
    else if (key == "mime")
        section.mimes = words(value);
    else
        problems_.push_back(section.contentType + ": no meaning for: " + std::string(line));
}

// A parent stands before its children in the text, so that one pass does and no circle can arise.
void FileTypeTable::addTypes(const std::vector<Section>& sections) {
    for (const Section& section : sections) {
        FileType type{section.contentType, {section.contentType}, section.kind};
        for (const std::string& name : section.parents) {
            const FileType* parent = typeNamed(name);
            if (!parent) {
                problems_.push_back(section.contentType + ": unknown parent " + name);
                continue;
            }
            if (type.kind.empty())
                type.kind = parent->kind;
            for (const std::string& ancestor : parent->contentTypeTree)
                if (!contains(type.contentTypeTree, ancestor))
                    type.contentTypeTree.push_back(ancestor);
        }
        markByAncestors(type);
        if (!types_.emplace(section.contentType, std::move(type)).second)
            problems_.push_back(section.contentType + ": declared twice");
    }
}

void FileTypeTable::addExtensions(const Section& section) {
    const FileType* type = typeNamed(section.contentType);
    for (const std::string& extension : section.extensions)
        if (!typesByExtension_.emplace(lowerCase(extension), type).second)
            problems_.push_back(section.contentType + ": another type has the extension " + extension);
}

void FileTypeTable::addMimes(const Section& section) {
    const FileType* type = typeNamed(section.contentType);
    for (const std::string& mime : section.mimes)
        if (!typesByMime_.emplace(mime, type).second)
            problems_.push_back(section.contentType + ": another type has the MIME type " + mime);
}

const FileType* FileTypeTable::typeForExtension(std::string_view extension) const {
    const auto found = typesByExtension_.find(lowerCase(extension));
    return found == typesByExtension_.end() ? nullptr : found->second;
}

const FileType* FileTypeTable::typeNamed(std::string_view contentType) const {
    const auto found = types_.find(std::string(contentType));
    return found == types_.end() ? nullptr : &found->second;
}

const FileType* FileTypeTable::typeForMime(std::string_view mime) const {
    const auto found = typesByMime_.find(std::string(mime));
    return found == typesByMime_.end() ? nullptr : found->second;
}

const FileType* typeForExtension(std::string_view extension) {
    return FileTypeTable::shared().typeForExtension(extension);
}

bool isPackageExtension(std::string_view extension) {
    const FileType* type = typeForExtension(extension);
    return type && type->isPackage;
}

const FileType& typeOfFile(std::string_view name) {
    static const FileType plain = *FileTypeTable::shared().typeNamed("public.data");
    const FileType* type = typeForExtension(platform::path::extension(name));
    return type && !type->isPackage ? *type : plain;
}

const FileType& typeOfFolder(std::string_view name) {
    static const FileType plain = *FileTypeTable::shared().typeNamed("public.folder");
    const FileType* type = typeForExtension(platform::path::extension(name));
    return type && type->isPackage ? *type : plain;
}

}  // namespace vexo

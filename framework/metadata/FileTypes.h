// What a file is, told by the extension of its name and by whether it is a folder. No file is looked at: what
// the content says is ContentType's.
//
// The table is the text of file-types.ini, built into the library. Immutable once made; callable from any
// thread.
#pragma once

#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace vexo {

struct FileType {
    std::string contentType;                   // "public.mpeg-4"
    std::vector<std::string> contentTypeTree;  // the content type itself, then all it is a special case of
    std::string kind;                          // "MPEG-4 movie"
    bool isPackage = false;                    // a folder with the extension is shown as one document
    bool isMovie = false;
    bool isSound = false;
};

class FileTypeTable {
  public:
    explicit FileTypeTable(std::string_view iniText);

    // The types that Vexo knows.
    static const FileTypeTable& shared();

    // Each answers nil for what the table lacks. An extension has no dot and may be in any case.
    const FileType* typeForExtension(std::string_view extension) const;
    const FileType* typeNamed(std::string_view contentType) const;
    const FileType* typeForMime(std::string_view mime) const;

    // What is wrong with the text, one line each: unknown words and parents, extensions and MIME types
    // claimed twice. What is right of it counts nevertheless.
    const std::vector<std::string>& problems() const { return problems_; }

  private:
    struct Section;

    std::vector<Section> sectionsOf(std::string_view iniText);
    void readEntry(Section& section, std::string_view line);
    void addTypes(const std::vector<Section>& sections);
    void addExtensions(const Section& section);
    void addMimes(const Section& section);

    std::unordered_map<std::string, FileType> types_;                    // by content type
    std::unordered_map<std::string, const FileType*> typesByExtension_;  // in lower case
    std::unordered_map<std::string, const FileType*> typesByMime_;
    std::vector<std::string> problems_;
};

// The type of the files with this extension, nil for one that the shared table lacks.
const FileType* typeForExtension(std::string_view extension);
// Whether a folder with this extension is shown as one document.
bool isPackageExtension(std::string_view extension);

// The type of an item by its name: an extension that means a package counts for folders alone, any other for
// files alone. What has no type of its own is "public.data" or "public.folder".
const FileType& typeOfFile(std::string_view name);
const FileType& typeOfFolder(std::string_view name);

// The text of file-types.ini.
extern const std::string_view fileTypesText;

}  // namespace vexo

#include "benchmarks/PeerWalks.h"

#include <fts.h>
#include <gio/gio.h>

#include <cstdio>
#include <filesystem>
#include <memory>
#include <stdexcept>

namespace bench {

namespace fs = std::filesystem;

namespace {

struct Release {
    void operator()(gpointer object) const { g_object_unref(object); }
    void operator()(FTS* walk) const { fts_close(walk); }
    void operator()(std::FILE* pipe) const { pclose(pipe); }
};
template <typename T>
using Owned = std::unique_ptr<T, Release>;

long countInFolder(GFile* folder) {
    const Owned<GFileEnumerator> entries(
        g_file_enumerate_children(folder, "standard::name,standard::type,standard::size,time::*",
                                  G_FILE_QUERY_INFO_NOFOLLOW_SYMLINKS, nullptr, nullptr));
    if (!entries)
        throw std::runtime_error("GLib cannot list a folder");
    long files = 0;
    GFileInfo* info = nullptr;
    GFile* child = nullptr;
    while (g_file_enumerator_iterate(entries.get(), &info, &child, nullptr, nullptr) && info) {
        if (g_file_info_get_file_type(info) == G_FILE_TYPE_DIRECTORY)
            files += countInFolder(child);
        else
            files += g_file_info_get_file_type(info) == G_FILE_TYPE_REGULAR;
    }
    return files;
}

}  // namespace

long countWithStandardLibrary(const std::string& folder) {
    long files = 0;
    for (const auto& entry : fs::recursive_directory_iterator(folder))
        files += fs::is_regular_file(fs::symlink_status(entry.path()));
    return files;
}

long countWithGLib(const std::string& folder) {
    const Owned<GFile> file(g_file_new_for_path(folder.c_str()));
    return countInFolder(file.get());
}

long countWithFTS(const std::string& folder) {
    std::string path = folder;
    char* const paths[] = {path.data(), nullptr};
    const Owned<FTS> walk(fts_open(paths, FTS_PHYSICAL | FTS_NOCHDIR, nullptr));
    long files = 0;
    while (const FTSENT* entry = walk ? fts_read(walk.get()) : nullptr)
        files += entry->fts_info == FTS_F;
    return files;
}

long countWithFind(const std::string& folder) {
    const std::string command = "find '" + folder + "' -type f -printf '%s %T@ %p\\n'";
    const Owned<std::FILE> pipe(popen(command.c_str(), "r"));
    long files = 0;
    for (int character = 0; pipe && (character = getc_unlocked(pipe.get())) != EOF;)
        files += character == '\n';
    return files;
}

}  // namespace bench

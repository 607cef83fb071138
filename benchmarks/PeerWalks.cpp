#include "benchmarks/PeerWalks.h"

#include <fts.h>
#include <gio/gio.h>
#include <grilo.h>
#include <sys/xattr.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <memory>
#include <stdexcept>

#include "benchmarks/LibplistDocument.h"

namespace bench {

namespace fs = std::filesystem;

namespace {

struct Release {
    void operator()(gpointer object) const { g_object_unref(object); }
    void operator()(GList* list) const { g_list_free(list); }
    void operator()(char* text) const { g_free(text); }
    void operator()(FTS* walk) const { fts_close(walk); }
    void operator()(std::FILE* pipe) const { pclose(pipe); }
};
template <typename T>
using Owned = std::unique_ptr<T, Release>;

bool isClip(const std::string& path) {
    return path.ends_with(".mov");
}

void visitDocument(const std::string& path, PeerFindings& findings) {
    findings.projects += !isTrailerByLibplist(path);
}

void visitFile(const std::string& path, PeerFindings& findings) {
    if (!isClip(path))
        return visitDocument(path, findings);
    getxattr(path.c_str(), "user.date", nullptr, 0);
    ++findings.clips;
}

// GLib reads the attribute together with the status.
void visitFolder(GFile* folder, PeerFindings& findings) {
    const Owned<GFileEnumerator> entries(
        g_file_enumerate_children(folder, "standard::name,standard::type,standard::size,time::*,xattr::date",
                                  G_FILE_QUERY_INFO_NOFOLLOW_SYMLINKS, nullptr, nullptr));
    if (!entries)
        throw std::runtime_error("GLib cannot list a folder");
    GFileInfo* info = nullptr;
    GFile* child = nullptr;
    while (g_file_enumerator_iterate(entries.get(), &info, &child, nullptr, nullptr) && info) {
        if (g_file_info_get_file_type(info) == G_FILE_TYPE_DIRECTORY)
            visitFolder(child, findings);
        else if (isClip(g_file_info_get_name(info)))
            ++findings.clips;
        else
            visitDocument(g_file_peek_path(child), findings);
    }
}

GrlSource* griloSourceOf(const std::string& folder) {
    grl_init(nullptr, nullptr);
    GrlRegistry* registry = grl_registry_get_default();
    GrlConfig* config = grl_config_new("grl-filesystem", nullptr);
    const Owned<char> uri(g_filename_to_uri(folder.c_str(), nullptr, nullptr));
    grl_config_set_string(config, "base-uri", uri.get());
    grl_registry_add_config(registry, config, nullptr);
    if (!grl_registry_load_all_plugins(registry, FALSE, nullptr) ||
        !grl_registry_activate_plugin_by_id(registry, "grl-filesystem", nullptr))
        throw std::runtime_error("Grilo's source of files is not there");
    return grl_registry_lookup_source(registry, "grl-filesystem");
}

long countVideos(GrlSource* source, GrlMedia* container, GList* keys, GrlOperationOptions* options) {
    long videos = 0;
    GList* const items = grl_source_browse_sync(source, container, keys, options, nullptr);
    for (const GList* item = items; item; item = item->next) {
        auto* media = static_cast<GrlMedia*>(item->data);
        videos += grl_media_is_container(media) ? countVideos(source, media, keys, options)
                                                : grl_media_is_video(media);
    }
    g_list_free_full(items, g_object_unref);
    return videos;
}

}  // namespace

PeerFindings walkWithStandardLibrary(const std::string& folder) {
    PeerFindings findings;
    for (const auto& entry : fs::recursive_directory_iterator(folder))
        if (fs::is_regular_file(fs::symlink_status(entry.path())))
            visitFile(entry.path(), findings);
    return findings;
}

PeerFindings walkWithGLib(const std::string& folder) {
    PeerFindings findings;
    const Owned<GFile> file(g_file_new_for_path(folder.c_str()));
    visitFolder(file.get(), findings);
    return findings;
}

PeerFindings walkWithFTS(const std::string& folder) {
    std::string path = folder;
    char* const paths[] = {path.data(), nullptr};
    const Owned<FTS> walk(fts_open(paths, FTS_PHYSICAL | FTS_NOCHDIR, nullptr));
    PeerFindings findings;
    while (const FTSENT* entry = walk ? fts_read(walk.get()) : nullptr)
        if (entry->fts_info == FTS_F)
            visitFile(entry->fts_path, findings);
    return findings;
}

PeerFindings walkWithFind(const std::string& folder) {
    const std::string command = "find '" + folder + "' -type f -printf '%s %T@ %p\\n'";
    const Owned<std::FILE> pipe(popen(command.c_str(), "r"));
    PeerFindings findings;
    char* line = nullptr;
    std::size_t room = 0;
    for (ssize_t length = 0; pipe && (length = getline(&line, &room, pipe.get())) > 0;) {
        const std::string found(line, static_cast<std::size_t>(length) - 1);
        visitFile(found.substr(found.find('/')), findings);
    }
    std::free(line);
    return findings;
}

PeerFindings walkWithGrilo(const std::string& folder) {
    GrlSource* source = griloSourceOf(folder);
    const Owned<GList> keys(grl_metadata_key_list_new(GRL_METADATA_KEY_TITLE, GRL_METADATA_KEY_URL,
                                                      GRL_METADATA_KEY_MODIFICATION_DATE,
                                                      GRL_METADATA_KEY_INVALID));
    const Owned<GrlOperationOptions> options(grl_operation_options_new(nullptr));
    grl_operation_options_set_resolution_flags(options.get(), GRL_RESOLVE_FAST_ONLY);
    return {countVideos(source, nullptr, keys.get(), options.get()), 0};
}

}  // namespace bench

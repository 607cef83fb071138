#include "benchmarks/LibplistDocument.h"

#include <plist/plist.h>

#include <filesystem>
#include <fstream>
#include <memory>
#include <stdexcept>
#include <string_view>

namespace bench {

namespace {

struct Release {
    void operator()(void* list) const { plist_free(list); }
};

// Where a reference of the archive leads to; nil for none.
plist_t archived(plist_t objects, plist_t reference) {
    std::uint64_t number = 0;
    if (!reference || plist_get_node_type(reference) != PLIST_UID)
        return nullptr;
    plist_get_uid_val(reference, &number);
    return plist_array_get_item(objects, static_cast<std::uint32_t>(number));
}

// The value under `key` of a dictionary that is archived as two lists.
plist_t archivedValueOf(plist_t objects, plist_t dictionary, const char* key) {
    plist_t keys = dictionary ? plist_dict_get_item(dictionary, "NS.keys") : nullptr;
    for (std::uint32_t i = 0; keys && i < plist_array_get_size(keys); ++i) {
        const char* text = plist_get_string_ptr(archived(objects, plist_array_get_item(keys, i)), nullptr);
        if (std::string_view(text ? text : "") == key)
            return archived(objects, plist_array_get_item(plist_dict_get_item(dictionary, "NS.objects"), i));
    }
    return nullptr;
}

}  // namespace

bool isTrailerByLibplist(const std::string& document) {
    std::string bytes(std::filesystem::file_size(document), '\0');
    std::ifstream(document, std::ios::binary).read(bytes.data(), static_cast<std::streamsize>(bytes.size()));
    plist_t list = nullptr;
    plist_from_memory(bytes.data(), static_cast<std::uint32_t>(bytes.size()), &list);
    const std::unique_ptr<void, Release> owned(list);
    if (!list)
        throw std::runtime_error("libplist cannot read " + document);
    plist_t objects = plist_dict_get_item(list, "$objects");
    plist_t root = archived(objects, plist_access_path(list, 2, "$top", "root"));
    return archivedValueOf(objects, archivedValueOf(objects, root, "editInfo"), "trailer") != nullptr;
}

}  // namespace bench

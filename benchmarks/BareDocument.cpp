#include "benchmarks/BareDocument.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>

#include <cstdint>
#include <cstring>
#include <string_view>

#include "platform/linux/FileDescriptor.h"

namespace bench {

namespace {

// A binary property list of one's own making.
class BareList {
  public:
    BareList(const unsigned char* bytes, std::size_t size) : bytes_(bytes) {
        const std::size_t trailer = size - 32;
        offsetWidth_ = bytes[trailer + 6];
        referenceWidth_ = bytes[trailer + 7];
        table_ = number(trailer + 24, 8);
        top_ = place(number(trailer + 16, 8));
    }

    std::size_t top() const { return top_; }

    // Where the value under `key` lies; 0 for none.
    std::size_t valueOf(std::size_t dictionary, std::string_view key) const {
        const Content content = contentAt(dictionary);
        for (std::size_t i = 0; i < content.count; ++i)
            if (isText(reference(content, i), key))
                return reference(content, content.count + i);
        return 0;
    }
    // The same for a dictionary that is archived, as two lists of its keys and its values.
    std::size_t archivedValueOf(std::size_t dictionary, std::string_view key, std::size_t objects) const {
        const Content keys = contentAt(valueOf(dictionary, "NS.keys"));
        for (std::size_t i = 0; i < keys.count; ++i)
            if (isText(archived(reference(keys, i), objects), key))
                return archived(reference(contentAt(valueOf(dictionary, "NS.objects")), i), objects);
        return 0;
    }
    // What a reference of the archive leads to.
    std::size_t archived(std::size_t uid, std::size_t objects) const {
        return reference(contentAt(objects), number(uid + 1, (bytes_[uid] & 0xF) + 1u));
    }

  private:
    struct Content {
        std::size_t count;
        std::size_t offset;
    };

    std::uint64_t number(std::size_t offset, std::size_t width) const {
        std::uint64_t number = 0;
        for (std::size_t i = 0; i < width; ++i)
            number = number << 8 | bytes_[offset + i];
        return number;
    }
    std::size_t place(std::uint64_t object) const {
        return number(table_ + object * offsetWidth_, offsetWidth_);
    }
    std::size_t reference(const Content& content, std::size_t index) const {
        return place(number(content.offset + index * referenceWidth_, referenceWidth_));
    }
    Content contentAt(std::size_t object) const {
        const std::size_t count = bytes_[object] & 0xF;
        if (count != 0xF)
            return {count, object + 1};
        const std::size_t width = std::size_t{1} << (bytes_[object + 1] & 0xF);
        return {number(object + 2, width), object + 2 + width};
    }
    bool isText(std::size_t object, std::string_view text) const {
        const Content content = contentAt(object);
        return content.count == text.size() &&
               std::memcmp(bytes_ + content.offset, text.data(), text.size()) == 0;
    }

    const unsigned char* const bytes_;
    std::size_t offsetWidth_;
    std::size_t referenceWidth_;
    std::size_t table_;
    std::size_t top_;
};

}  // namespace

bool isTrailerBarely(int folder, const char* name) {
    const platform::FileDescriptor file(openat(folder, name, O_RDONLY | O_CLOEXEC));
    struct stat status {};
    if (!file || fstat(file.number(), &status) != 0)
        return false;
    const auto size = static_cast<std::size_t>(status.st_size);
    void* const bytes = mmap(nullptr, size, PROT_READ, MAP_PRIVATE, file.number(), 0);
    if (bytes == MAP_FAILED)
        return false;
    const BareList list(static_cast<const unsigned char*>(bytes), size);
    const std::size_t objects = list.valueOf(list.top(), "$objects");
    const std::size_t root = list.archived(list.valueOf(list.valueOf(list.top(), "$top"), "root"), objects);
    const std::size_t editInfo = list.archivedValueOf(root, "editInfo", objects);
    const bool isTrailer = editInfo && list.archivedValueOf(editInfo, "trailer", objects);
    munmap(bytes, size);
    return isTrailer;
}

}  // namespace bench

// Opens any bytes as a keyed archive and looks around in it, with errors that raise and with errors that
// count as unreadable. Nothing but ArchiveError may come out, and nothing at all in the second case.
#include <cstdint>

#include "fuzzing/Require.h"
#include "platform/KeyedUnarchiver.h"

using namespace platform;

namespace {

class Stranger final : public ArchivedObject {
  public:
    explicit Stranger(KeyedUnarchiver& coder) : coder_(coder), name_(coder.decodeObjectForKey("name")) {}

    std::string description() const override { return name_ ? name_->description() : ""; }
    ArchivedObjectRef objectForKey(std::string_view) const override { return coder_.reject("no dictionary"); }

  private:
    KeyedUnarchiver& coder_;
    const ArchivedObjectRef name_;
};

class Delegate final : public KeyedUnarchiverDelegate {
  public:
    ArchivedClass cannotDecodeObjectOfClassName(KeyedUnarchiver&, std::string_view className,
                                                const std::vector<std::string>&) override {
        if (className.empty())
            return nullptr;
        return [](KeyedUnarchiver& coder) -> ArchivedObjectRef { return std::make_shared<Stranger>(coder); };
    }
};

void lookAround(std::span<const std::uint8_t> bytes) {
    const std::span content = std::as_bytes(bytes);
    Delegate delegate;
    KeyedUnarchiver unarchiver(
        std::make_unique<MemoryByteSource>(std::vector<std::byte>(content.begin(), content.end())),
        &delegate);
    ArchivedObjectRef object = unarchiver.decodeObjectForKey("root");
    for (const char* key : {"editInfo", "trailer"}) {
        if (!object)
            return;
        static_cast<void>(object->description());
        if (unarchiver.decodeObjectForKey("root"))
            require(object->objectForKey(key) == object->objectForKey(key));
        object = object->objectForKey(key);
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    try {
        lookAround({data, size});
    } catch (const ArchiveError&) {
    }
    int reportCount = 0;
    const RejectedArchivesAsUnreadable scope(
        [](const ArchiveError&, void* count) { ++*static_cast<int*>(count); }, &reportCount);
    lookAround({data, size});
    require(reportCount <= 1);
    return 0;
}

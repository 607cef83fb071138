#include "framework/ModuleFile.h"

#include <elf.h>
#include <link.h>

#include <algorithm>
#include <cstring>
#include <vector>

#include "platform/linux/PlainFile.h"

// The header of the binary that this is compiled into, which the linker finds.
extern "C" const ElfW(Ehdr) __ehdr_start __attribute__((visibility("hidden")));

namespace vexo {
namespace {

using platform::PlainFile;
using Header = ElfW(Ehdr);
using Segment = ElfW(Phdr);

template <typename Part>
bool readParts(const PlainFile& file, std::uint64_t offset, Part* first, std::size_t count) {
    const std::size_t bytes = count * sizeof(Part);
    return platform::readAt(file.descriptor, offset, reinterpret_cast<std::byte*>(first), bytes) ==
           static_cast<std::ptrdiff_t>(bytes);
}

bool isModule(const Header& header) {
    return std::memcmp(header.e_ident, ELFMAG, SELFMAG) == 0;
}

bool isForThisMachine(const Header& header) {
    const Header& ours = __ehdr_start;
    return header.e_ident[EI_CLASS] == ours.e_ident[EI_CLASS] &&
           header.e_ident[EI_DATA] == ours.e_ident[EI_DATA] && header.e_machine == ours.e_machine;
}

bool isWithin(const PlainFile& file, const Segment& segment) {
    return segment.p_type != PT_LOAD ||
           (segment.p_offset <= file.size && segment.p_filesz <= file.size - segment.p_offset);
}

bool isWhole(const PlainFile& file, const Header& header) {
    std::vector<Segment> segments(header.e_phnum);
    return header.e_phentsize == sizeof(Segment) &&
           readParts(file, header.e_phoff, segments.data(), segments.size()) &&
           std::all_of(segments.begin(), segments.end(),
                       [&](const Segment& segment) { return isWithin(file, segment); });
}

}  // namespace

std::optional<std::string> problemOfModuleFile(const std::string& path) {
    const PlainFile file = PlainFile::open(path);
    if (!file)
        return std::string("it cannot be read: ") + std::strerror(file.error);
    Header header{};
    if (!readParts(file, 0, &header, 1) || !isModule(header))
        return "it is no module";
    if (!isForThisMachine(header))
        return "it was built for another kind of machine";
    if (!isWhole(file, header))
        return "it is cut off or damaged";
    return std::nullopt;
}

}  // namespace vexo

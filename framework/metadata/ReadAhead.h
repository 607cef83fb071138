// Entries of the index that were read together with one that was asked for: files that were made together are
// asked for together, and their inodes lie together. One statement that reads them all costs little more than
// one that reads a single entry.
//
// Only what is there is remembered: an entry that is missing here may have been stored since. Belongs to one
// thread at a time.
#pragma once

#include <algorithm>
#include <cstdint>
#include <unordered_map>
#include <utility>

#include "framework/metadata/IndexTable.h"

namespace vexo {

class ReadAhead {
  public:
    // The first and the last inode of the block that holds the file's.
    static std::pair<std::uint64_t, std::uint64_t> inodesAround(const FileKey& key) {
        const std::uint64_t first = key.inode / blockInodes * blockInodes;
        return {first, first + (blockInodes - 1)};
    }

    // nil for what is not here. Valid until the next change.
    IndexTable::Entry* find(const FileKey& key) {
        const auto block = blocks_.find(numberOf(key));
        if (block == blocks_.end())
            return nullptr;
        auto& entries = block->second;
        const auto entry = std::find_if(entries.begin(), entries.end(),
                                        [&key](const auto& each) { return each.key == key; });
        return entry == entries.end() ? nullptr : &*entry;
    }
    // `entries`: all that the index holds of the key's block.
    void put(const FileKey& key, IndexTable::Entries entries) {
        if (blocks_.size() >= mostBlocks)
            blocks_.clear();
        blocks_.insert_or_assign(numberOf(key), std::move(entries));
    }
    // Forgets the block of a key.
    void drop(const FileKey& key) { blocks_.erase(numberOf(key)); }

  private:
    static constexpr std::uint64_t blockInodes = 64;
    static constexpr std::size_t mostBlocks = 64;  // at most a megabyte or two, titles apart

    // Blocks of two devices may have one number: keys are compared whole.
    static std::uint64_t numberOf(const FileKey& key) { return key.inode / blockInodes ^ key.device << 40; }

    std::unordered_map<std::uint64_t, IndexTable::Entries> blocks_;
};

}  // namespace vexo

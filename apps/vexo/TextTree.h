// A tree of groups and items as text that a person enjoys reading: names at the left, what they are at the
// right.
#pragma once

#include <array>
#include <optional>
#include <ostream>
#include <string>
#include <vector>

#include "apps/vexo/Terminal.h"
#include "host/VXMediaManager.h"

namespace vexo {

struct TextTreeOptions {
    std::optional<int> depth;   // levels of groups below the root; nil for all
    bool withMetadata = false;  // also read the length and size of event clips, which a load leaves alone
};

class TextTree {
  public:
    TextTree(const VXMediaGroupRef& root, const TextTreeOptions& options);

    void print(std::ostream& out, const OutputStyle& style) const;

  private:
    enum class Emphasis { group, item };
    static constexpr std::size_t detailCount = 2;
    // Of a group what it is, and when; of an item its size in pixels, and its length.
    using Details = std::array<std::string, detailCount>;

    struct Row {
        std::string guide;  // the lines that lead to the name
        std::string name;
        Emphasis emphasis;
        Details details;
    };

    // Where a row hangs: the lines of the levels above it.
    struct Place {
        std::string guideBefore;
        bool isLast;
        std::string guide() const { return guideBefore + (isLast ? "└── " : "├── "); }
        std::string guideBelow() const { return guideBefore + (isLast ? "    " : "│   "); }
    };

    void addRoot(const VXMediaGroupRef& root);
    void addGroup(const VXMediaGroupRef& group, const Place& place, std::optional<int> depth);
    void addContent(const VXMediaGroupRef& group, const std::string& guide, std::optional<int> depth);
    void addItem(const VXMediaObjectRef& mediaObject, const Place& place, bool isMovieOfProject);

    std::size_t nameWidth(const OutputStyle& style,
                          const std::array<std::size_t, detailCount>& detailWidths) const;

    const TextTreeOptions options_;
    std::vector<Row> rows_;
};

// Prints a plug-in's tree, and what the plug-in has to say where it is empty.
void printTree(VXMediaManager& manager, const VXMediaGroupRef& root, const TextTreeOptions& options,
               const OutputStyle& style, std::ostream& out);

}  // namespace vexo

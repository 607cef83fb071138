// Lines of text laid out with Pango, in the desktop's usual font. One point is one unit of a Cairo context.
//
// Laying text out costs several times what drawing it does, so each thread keeps what it has laid out last.
#pragma once

#include <pango/pangocairo.h>

#include <memory>
#include <vector>

#include "platform/Drawing.h"

namespace platform {

struct TextRelease {
    void operator()(gpointer object) const { g_object_unref(object); }
    void operator()(PangoFontDescription* description) const { pango_font_description_free(description); }
    void operator()(cairo_font_options_t* options) const { cairo_font_options_destroy(options); }
    void operator()(cairo_scaled_font_t* font) const { cairo_scaled_font_destroy(font); }
};
template <typename T>
using TextOwned = std::unique_ptr<T, TextRelease>;

// A text as one line, laid out and measured.
class TextLine {
  public:
    explicit TextLine(TextOwned<PangoLayout> layout);

    Size size() const { return size_; }  // in points
    // Draws it in the context's colour, its upper left corner there.
    void draw(cairo_t* context, double left, double top) const;

  private:
    // Glyphs of one font, from the line's left end.
    struct Run {
        TextOwned<cairo_scaled_font_t> font;
        std::vector<cairo_glyph_t> glyphs;
    };

    static std::vector<Run> runsOf(PangoLayout* layout);

    Size size_;
    double baseline_;  // below the upper edge
    // Pango draws a line that has characters of no font, as boxes of their numbers, and Cairo alone any
    // other.
    TextOwned<PangoLayout> boxes_;
    std::vector<Run> runs_;
};

// nil for a font of a size that is not drawn. Belongs to the calling thread, until its next call.
const TextLine* lineOf(const AttributedString& text);

}  // namespace platform

#include "platform/linux/drawing/TextLayout.h"

#include <span>
#include <unordered_map>
#include <utility>

#include "platform/Text.h"

namespace platform {
namespace {

// Advances that are not rounded to pixels make a text equally wide at every scale. Colour fringes would show
// on what is laid over a picture.
TextOwned<PangoContext> newContext() {
    const TextOwned<PangoFontMap> fontMap(pango_cairo_font_map_new());
    TextOwned<PangoContext> context(pango_font_map_create_context(fontMap.get()));
    const TextOwned<cairo_font_options_t> options(cairo_font_options_create());
    cairo_font_options_set_hint_metrics(options.get(), CAIRO_HINT_METRICS_OFF);
    cairo_font_options_set_hint_style(options.get(), CAIRO_HINT_STYLE_SLIGHT);
    cairo_font_options_set_antialias(options.get(), CAIRO_ANTIALIAS_GRAY);
    pango_cairo_context_set_font_options(context.get(), options.get());
    pango_context_set_round_glyph_positions(context.get(), FALSE);
    return context;
}

TextOwned<PangoFontDescription> descriptionOf(const Font& font) {
    TextOwned<PangoFontDescription> description(pango_font_description_new());
    pango_font_description_set_family_static(description.get(), "sans-serif");
    pango_font_description_set_weight(description.get(), font.bold ? PANGO_WEIGHT_BOLD : PANGO_WEIGHT_NORMAL);
    pango_font_description_set_absolute_size(description.get(), font.size * PANGO_SCALE);
    return description;
}

double points(int pangoUnits) {
    return pangoUnits / double(PANGO_SCALE);
}

Size sizeOf(PangoLayout* layout) {
    int width = 0, height = 0;
    pango_layout_get_size(layout, &width, &height);
    return {points(width), points(height)};
}

// They begin at `left`, which becomes where they end.
std::vector<cairo_glyph_t> glyphsOf(const PangoGlyphString& string, double& left) {
    std::vector<cairo_glyph_t> glyphs;
    for (const auto& [glyph, geometry, attributes] : std::span(string.glyphs, string.num_glyphs)) {
        if (glyph != PANGO_GLYPH_EMPTY)
            glyphs.push_back({glyph, left + points(geometry.x_offset), points(geometry.y_offset)});
        left += points(geometry.width);
    }
    return glyphs;
}

// What one thread has laid out.
class Lines {
  public:
    const TextLine* find(const AttributedString& text) {
        const auto known = lines_.find(text);
        if (known != lines_.end())
            return &known->second;
        if (lines_.size() >= mostLines)
            lines_.clear();
        return &lines_.try_emplace(text, newLayout(text)).first->second;
    }

  private:
    // A colour does not change how a text is laid out.
    struct HashOfText {
        std::size_t operator()(const AttributedString& text) const {
            return std::hash<std::string>()(text.text());
        }
    };
    struct LooksAlike {
        bool operator()(const AttributedString& one, const AttributedString& other) const {
            return one.text() == other.text() && one.font().size == other.font().size &&
                   one.font().bold == other.font().bold;
        }
    };

    // More than the thumbnails in sight.
    static constexpr std::size_t mostLines = 256;

    TextOwned<PangoLayout> newLayout(const AttributedString& text) const {
        TextOwned<PangoLayout> layout(pango_layout_new(context_.get()));
        pango_layout_set_single_paragraph_mode(layout.get(), TRUE);
        pango_layout_set_font_description(layout.get(), descriptionOf(text.font()).get());
        const std::string line = validUTF8(text.text());
        pango_layout_set_text(layout.get(), line.data(), static_cast<int>(line.size()));
        return layout;
    }

    const TextOwned<PangoContext> context_ = newContext();
    std::unordered_map<AttributedString, TextLine, HashOfText, LooksAlike> lines_;
};

}  // namespace

TextLine::TextLine(TextOwned<PangoLayout> layout)
    : size_(sizeOf(layout.get())), baseline_(points(pango_layout_get_baseline(layout.get()))) {
    if (pango_layout_get_unknown_glyphs_count(layout.get()) > 0)
        boxes_ = std::move(layout);
    else
        runs_ = runsOf(layout.get());
}

std::vector<TextLine::Run> TextLine::runsOf(PangoLayout* layout) {
    std::vector<Run> runs;
    double left = 0;
    for (const GSList* list = pango_layout_get_line_readonly(layout, 0)->runs; list; list = list->next) {
        const auto& run = *static_cast<const PangoLayoutRun*>(list->data);
        auto glyphs = glyphsOf(*run.glyphs, left);
        auto* font = pango_cairo_font_get_scaled_font(PANGO_CAIRO_FONT(run.item->analysis.font));
        if (font)
            runs.push_back(
                {TextOwned<cairo_scaled_font_t>(cairo_scaled_font_reference(font)), std::move(glyphs)});
    }
    return runs;
}

void TextLine::draw(cairo_t* context, double left, double top) const {
    cairo_matrix_t before;
    cairo_get_matrix(context, &before);
    cairo_translate(context, left, top + baseline_);
    for (const Run& run : runs_) {
        cairo_set_scaled_font(context, run.font.get());
        cairo_show_glyphs(context, run.glyphs.data(), static_cast<int>(run.glyphs.size()));
    }
    if (boxes_)
        pango_cairo_show_layout_line(context, pango_layout_get_line_readonly(boxes_.get(), 0));
    cairo_set_matrix(context, &before);
}

const TextLine* lineOf(const AttributedString& text) {
    constexpr double largestFont = 1000;
    constexpr std::size_t longestText = 1000;
    const double size = text.font().size;
    if (!(size > 0) || size > largestFont || text.text().size() > longestText)
        return nullptr;
    thread_local Lines lines;
    return lines.find(text);
}

}  // namespace platform

#include "platform/linux/TextLayout.h"

#include <map>
#include <tuple>

#include "platform/Text.h"

namespace platform {
namespace {

struct Release {
    void operator()(gpointer object) const { g_object_unref(object); }
    void operator()(PangoFontDescription* description) const { pango_font_description_free(description); }
    void operator()(cairo_font_options_t* options) const { cairo_font_options_destroy(options); }
};
template <typename T>
using Owned = std::unique_ptr<T, Release>;

// Advances that are not rounded to pixels make a text equally wide at every scale. Colour fringes would show
// on what is laid over a picture.
Owned<PangoContext> newContext() {
    const Owned<PangoFontMap> fontMap(pango_cairo_font_map_new());
    Owned<PangoContext> context(pango_font_map_create_context(fontMap.get()));
    const Owned<cairo_font_options_t> options(cairo_font_options_create());
    cairo_font_options_set_hint_metrics(options.get(), CAIRO_HINT_METRICS_OFF);
    cairo_font_options_set_hint_style(options.get(), CAIRO_HINT_STYLE_SLIGHT);
    cairo_font_options_set_antialias(options.get(), CAIRO_ANTIALIAS_GRAY);
    pango_cairo_context_set_font_options(context.get(), options.get());
    pango_context_set_round_glyph_positions(context.get(), FALSE);
    return context;
}

Owned<PangoFontDescription> descriptionOf(const Font& font) {
    Owned<PangoFontDescription> description(pango_font_description_new());
    pango_font_description_set_family_static(description.get(), "sans-serif");
    pango_font_description_set_weight(description.get(), font.bold ? PANGO_WEIGHT_BOLD : PANGO_WEIGHT_NORMAL);
    pango_font_description_set_absolute_size(description.get(), font.size * PANGO_SCALE);
    return description;
}

// What one thread has laid out.
class Layouts {
  public:
    PangoLayout* find(const AttributedString& text) {
        Key key{text.text(), text.font().size, text.font().bold};
        const auto known = layouts_.find(key);
        if (known != layouts_.end())
            return known->second.get();
        if (layouts_.size() >= mostLayouts)
            layouts_.clear();
        return layouts_.emplace(std::move(key), newLayout(text)).first->second.get();
    }

  private:
    using Key = std::tuple<std::string, double, bool>;

    // More than the thumbnails in sight.
    static constexpr std::size_t mostLayouts = 256;

    Owned<PangoLayout> newLayout(const AttributedString& text) const {
        Owned<PangoLayout> layout(pango_layout_new(context_.get()));
        pango_layout_set_single_paragraph_mode(layout.get(), TRUE);
        pango_layout_set_font_description(layout.get(), descriptionOf(text.font()).get());
        const std::string line = validUTF8(text.text());
        pango_layout_set_text(layout.get(), line.data(), static_cast<int>(line.size()));
        return layout;
    }

    const Owned<PangoContext> context_ = newContext();
    std::map<Key, Owned<PangoLayout>> layouts_;
};

}  // namespace

PangoLayout* layoutOf(const AttributedString& text) {
    constexpr double largestFont = 1000;
    constexpr std::size_t longestText = 1000;
    const double size = text.font().size;
    if (!(size > 0) || size > largestFont || text.text().size() > longestText)
        return nullptr;
    thread_local Layouts layouts;
    return layouts.find(text);
}

}  // namespace platform

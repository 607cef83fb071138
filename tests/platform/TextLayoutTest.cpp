#include "platform/linux/drawing/TextLayout.h"

#include <gtest/gtest.h>

#include "platform/linux/drawing/CairoCanvas.h"

namespace platform {
namespace {

constexpr int width = 200, height = 30;
constexpr double left = 10.25, top = 5.5;
constexpr Font font{10, /*bold=*/true};

template <typename DrawContent>
std::vector<std::uint32_t> pixelsOf(double scale, const DrawContent& drawContent) {
    const auto draw = [&](cairo_t* context) {
        cairo_set_source_rgb(context, 1, 1, 1);
        drawContent(context);
        return true;
    };
    return paint(int(width * scale), int(height * scale), {width, height}, draw).value().pixels;
}

// The same text laid out and drawn by Pango alone.
std::vector<std::uint32_t> drawnByPango(const std::string& text, double scale) {
    const TextOwned<PangoFontMap> fontMap(pango_cairo_font_map_new());
    const TextOwned<PangoContext> context(pango_font_map_create_context(fontMap.get()));
    const TextOwned<cairo_font_options_t> options(cairo_font_options_create());
    cairo_font_options_set_hint_metrics(options.get(), CAIRO_HINT_METRICS_OFF);
    cairo_font_options_set_hint_style(options.get(), CAIRO_HINT_STYLE_SLIGHT);
    cairo_font_options_set_antialias(options.get(), CAIRO_ANTIALIAS_GRAY);
    pango_cairo_context_set_font_options(context.get(), options.get());
    pango_context_set_round_glyph_positions(context.get(), FALSE);
    const TextOwned<PangoLayout> layout(pango_layout_new(context.get()));
    const TextOwned<PangoFontDescription> description(
        pango_font_description_from_string("sans-serif bold 10px"));
    pango_layout_set_font_description(layout.get(), description.get());
    pango_layout_set_text(layout.get(), text.data(), int(text.size()));
    return pixelsOf(scale, [&](cairo_t* cairo) {
        cairo_move_to(cairo, left, top);
        pango_cairo_show_layout(cairo, layout.get());
    });
}

TEST(TextLayout, ALineLooksAsPangoDrawsIt) {
    const std::string texts[] = {
        "12:34",
        "W\u00e4re fi \u201cso\u201d, AV.",
        "right \u05d0\u05d1\u05d2 to left",
        "e\u0301\u0323 combined",
        "of no font \U000F0000 here",
    };
    for (const std::string& text : texts) {
        const TextLine* line = lineOf({text, font, whiteColor});
        ASSERT_NE(line, nullptr);
        for (const double scale : {1.0, 1.5, 3.0}) {
            const auto pixels = pixelsOf(scale, [&](cairo_t* context) { line->draw(context, left, top); });
            EXPECT_EQ(pixels, drawnByPango(text, scale)) << text << " at " << scale;
            EXPECT_NE(pixels, pixelsOf(scale, [](cairo_t*) {})) << text << " at " << scale;
        }
    }
}

TEST(TextLayout, LinesOfOtherFontsAreOthers) {
    const Size bold = lineOf({"12:34", font, whiteColor})->size();
    EXPECT_NE(lineOf({"12:34", {10, false}, whiteColor})->size(), bold);
    EXPECT_NE(lineOf({"12:34", {11, true}, whiteColor})->size(), bold);
    EXPECT_EQ(lineOf({"12:34", font, {}})->size(), bold);
}

}  // namespace
}  // namespace platform

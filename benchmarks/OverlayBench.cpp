// What an overlay costs, made and drawn over a thumbnail, beside what its shapes cost with Cairo alone, and
// beside a peer that draws the same and has Pango lay out each text anew.
//
// The list imitated is one of a project library while it scrolls: thumbnails of 160 x 120 points, whose
// movies last from one to some minutes.
#include <benchmark/benchmark.h>
#include <fmt/format.h>
#include <pango/pangocairo.h>

#include <algorithm>
#include <functional>
#include <memory>
#include <stdexcept>

#include "benchmarks/Surroundings.h"
#include "framework/Host.h"
#include "host/VXConstants.h"

namespace {

constexpr int width = 160, height = 120;
constexpr int bandHeight = 12, iconSide = 20;
constexpr int durations = 100;  // the overlays in sight

platform::Bitmap greyThumbnail() {
    return {width, height, std::vector<std::uint32_t>(std::size_t(width) * height, 0xff404040)};
}

double microseconds(std::chrono::nanoseconds time) {
    return std::chrono::duration<double, std::micro>(time).count();
}

struct Release {
    void operator()(gpointer object) const { g_object_unref(object); }
    void operator()(PangoFontDescription* font) const { pango_font_description_free(font); }
    void operator()(cairo_surface_t* surface) const { cairo_surface_destroy(surface); }
    void operator()(cairo_t* context) const { cairo_destroy(context); }
};
template <typename T>
using Owned = std::unique_ptr<T, Release>;

// The shapes of an overlay, the icon ready to be drawn.
class BareShapes {
  public:
    explicit BareShapes(const platform::Picture& icon)
        : iconPixels_(icon.draw(iconSide, iconSide).value()),
          icon_(
              cairo_image_surface_create_for_data(reinterpret_cast<unsigned char*>(iconPixels_.pixels.data()),
                                                  CAIRO_FORMAT_ARGB32, iconSide, iconSide, iconSide * 4)) {}

    template <typename DrawText>
    void draw(platform::Bitmap& thumbnail, const DrawText& drawText) const {
        const Owned<cairo_surface_t> surface(
            cairo_image_surface_create_for_data(reinterpret_cast<unsigned char*>(thumbnail.pixels.data()),
                                                CAIRO_FORMAT_ARGB32, width, height, width * 4));
        const Owned<cairo_t> context(cairo_create(surface.get()));
        cairo_set_source_rgba(context.get(), 0, 0, 0, 0.5);
        cairo_rectangle(context.get(), 0, height - bandHeight, width, bandHeight);
        cairo_fill(context.get());
        cairo_set_source_surface(context.get(), icon_.get(), 2, height - iconSide + 1);
        cairo_paint(context.get());
        cairo_set_source_rgb(context.get(), 1, 1, 1);
        drawText(context.get());
    }

  private:
    platform::Bitmap iconPixels_;
    const Owned<cairo_surface_t> icon_;
};

// A text as Pango lays it out in the lower right corner.
class PangoText {
  public:
    PangoText(PangoContext* context, const std::string& text) : layout_(pango_layout_new(context)) {
        const Owned<PangoFontDescription> font(pango_font_description_from_string("sans-serif bold 10px"));
        pango_layout_set_font_description(layout_.get(), font.get());
        pango_layout_set_text(layout_.get(), text.data(), static_cast<int>(text.size()));
        int textWidth = 0, textHeight = 0;
        pango_layout_get_size(layout_.get(), &textWidth, &textHeight);
        left_ = width - 3 - textWidth / double(PANGO_SCALE);
        baseline_ =
            height + 0.5 - (textHeight - pango_layout_get_baseline(layout_.get())) / double(PANGO_SCALE);
    }

    void draw(cairo_t* context) const {
        cairo_move_to(context, left_, baseline_);
        pango_cairo_show_layout_line(context, pango_layout_get_line_readonly(layout_.get(), 0));
    }

  private:
    friend class ReadyGlyphs;

    const Owned<PangoLayout> layout_;
    double left_, baseline_;
};

// The same without Pango: the quickest way to draw a text again.
class ReadyGlyphs {
  public:
    ReadyGlyphs(PangoContext* context, const std::string& text) : text_(context, text) {
        const auto& run = *static_cast<const PangoLayoutRun*>(
            pango_layout_get_line_readonly(text_.layout_.get(), 0)->runs->data);
        font_ = pango_cairo_font_get_scaled_font(PANGO_CAIRO_FONT(run.item->analysis.font));
        double left = text_.left_;
        for (int i = 0; i < run.glyphs->num_glyphs; ++i) {
            glyphs_.push_back({run.glyphs->glyphs[i].glyph, left, text_.baseline_});
            left += run.glyphs->glyphs[i].geometry.width / double(PANGO_SCALE);
        }
    }

    void draw(cairo_t* context) const {
        cairo_set_scaled_font(context, font_);
        cairo_show_glyphs(context, glyphs_.data(), static_cast<int>(glyphs_.size()));
    }

  private:
    const PangoText text_;  // keeps the font
    cairo_scaled_font_t* font_;
    std::vector<cairo_glyph_t> glyphs_;
};

int whitePixelsOnTheRight(const platform::Bitmap& bitmap) {
    int count = 0;
    for (int y = height - bandHeight; y < height; ++y) {
        for (int x = width / 2; x < width; ++x)
            count += (bitmap.pixels[std::size_t(y * width + x)] & 255) > 200;
    }
    return count;
}

// Whether both drew a band, the icon, and about as much text.
bool areAlike(const platform::Bitmap& one, const platform::Bitmap& other) {
    const int text = whitePixelsOnTheRight(one), otherText = whitePixelsOnTheRight(other);
    if (text < 10 || otherText < text / 2 || otherText > text * 2)
        return false;
    for (std::size_t y = 0; y < height; ++y) {
        const auto row = one.pixels.begin() + std::ptrdiff_t(y * width);
        if (!std::equal(row, row + width / 2, other.pixels.begin() + std::ptrdiff_t(y * width)))
            return false;
    }
    return true;
}

// The plug-in as a host has loaded it, without a library.
class LoadedPlugin {
  public:
    LoadedPlugin() : host_(options()) {
        if (host_.loadPlugins())
            throw std::runtime_error("the plug-in is not there");
    }

    vexo::VXMediaManager& manager() const { return *host_.plugins()[0].manager; }

    // A project's movie that lasts `duration` seconds.
    vexo::VXMediaObjectRef movie(double duration) const {
        auto item = manager().newMediaObjectWithType(vexo::VXMediaTypeMovie, "movie", "movie");
        item->setAttribute("7", vexo::VXReelixProjectFormatVersion);
        item->setAttribute(duration, vexo::VXMediaObjectDurationKey);
        return item;
    }

    void drawOverlay(platform::Bitmap& thumbnail, const vexo::VXMediaObjectRef& item) const {
        const auto image = manager().thumbnailOverlayForMediaObject(item, {}, {width, height});
        if (!image->picture()->drawOver(thumbnail))
            throw std::runtime_error("an overlay cannot be drawn");
    }

  private:
    vexo::HostOptions options() const {
        vexo::HostOptions options;
        options.homeDirectory = home_.path();
        options.pluginBundles = {REELIX_BUNDLE_DIR};
        return options;
    }

    const bench::Folder home_;
    vexo::Host host_;
};

std::chrono::nanoseconds timeOf(const std::function<void()>& work) {
    const auto start = bench::processorTimeOfThread();
    work();
    return bench::processorTimeOfThread() - start;
}

// Makes and draws the overlays of a list again and again, as scrolling does. Processor time, and the quickest
// list of each kind: what else the machine does can only add to such a short task. The time in front is the
// mean.
void MakeAndDrawOverlays(benchmark::State& state) {
    const LoadedPlugin plugin;
    const BareShapes shapes(*plugin.manager().iconNamed("MBReelixAppIconSmall")->picture());
    const Owned<PangoContext> context(pango_font_map_create_context(pango_cairo_font_map_get_default()));
    const ReadyGlyphs glyphs(context.get(), "2:05");
    const auto drawBarely = [&](platform::Bitmap& thumbnail) {
        shapes.draw(thumbnail, [&](cairo_t* cairo) { glyphs.draw(cairo); });
    };
    const auto drawWithPango = [&](platform::Bitmap& thumbnail, const std::string& text) {
        shapes.draw(thumbnail, [&](cairo_t* cairo) { PangoText(context.get(), text).draw(cairo); });
    };
    platform::Bitmap thumbnail = greyThumbnail(), barely = thumbnail, withPango = thumbnail;
    drawBarely(barely);
    drawWithPango(withPango, "2:05");
    plugin.drawOverlay(thumbnail, plugin.movie(125));
    if (!areAlike(barely, thumbnail) || !areAlike(withPango, thumbnail))
        return state.SkipWithError("the overlay is not what the others draw");
    std::vector<vexo::VXMediaObjectRef> movies;
    for (int i = 0; i < durations; ++i)
        movies.push_back(plugin.movie(60 + 3 * i));

    auto time = std::chrono::nanoseconds::max(), floor = time, pango = time;
    for (auto _ : state) {
        const auto floorOfList = timeOf([&] {
            for (int i = 0; i < durations; ++i)
                drawBarely(thumbnail);
        });
        const auto pangoOfList = timeOf([&] {
            for (int i = 0; i < durations; ++i)
                drawWithPango(thumbnail, fmt::format("{}:{:02}", 1 + i / 20, i * 3 % 60));
        });
        const auto ours = timeOf([&] {
            for (const auto& movie : movies)
                plugin.drawOverlay(thumbnail, movie);
        });
        state.SetIterationTime(std::chrono::duration<double>(ours).count());
        time = std::min(time, ours);
        floor = std::min(floor, floorOfList);
        pango = std::min(pango, pangoOfList);
    }
    state.counters["us_per_overlay"] = microseconds(time) / durations;
    state.counters["floor_us"] = microseconds(floor) / durations;
    state.counters["to_floor"] = microseconds(time) / microseconds(floor);
    state.counters["to_pango"] = microseconds(time) / microseconds(pango);
}
BENCHMARK(MakeAndDrawOverlays)->UseManualTime()->Unit(benchmark::kMicrosecond);

}  // namespace

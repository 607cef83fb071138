// What an overlay costs, made and drawn, beside what its shapes cost with Cairo alone.
//
// The list imitated is one of a project library while it scrolls: thumbnails of 160 x 120 points, whose
// movies last from one to some minutes.
#include <benchmark/benchmark.h>
#include <pango/pangocairo.h>

#include <stdexcept>

#include "benchmarks/Surroundings.h"
#include "framework/Host.h"
#include "host/VXConstants.h"

namespace {

constexpr int width = 160, height = 120;
constexpr int bandHeight = 12, iconSide = 20;
constexpr int durations = 100;  // the overlays in sight

double microseconds(std::chrono::nanoseconds time) {
    return std::chrono::duration<double, std::micro>(time).count();
}

// The floor: one layout, one icon, both ready to be drawn.
class BareOverlay {
  public:
    explicit BareOverlay(const platform::Picture& icon)
        : iconPixels_(icon.draw(iconSide, iconSide).value()),
          layout_(pango_layout_new(context_)),
          icon_(
              cairo_image_surface_create_for_data(reinterpret_cast<unsigned char*>(iconPixels_.pixels.data()),
                                                  CAIRO_FORMAT_ARGB32, iconSide, iconSide, iconSide * 4)) {
        PangoFontDescription* font = pango_font_description_from_string("sans-serif bold 10px");
        pango_layout_set_font_description(layout_, font);
        pango_font_description_free(font);
        pango_layout_set_text(layout_, "2:05", -1);
        pango_layout_get_size(layout_, &textWidth_, &textHeight_);
    }
    ~BareOverlay() {
        cairo_surface_destroy(icon_);
        g_object_unref(layout_);
        g_object_unref(context_);
    }
    BareOverlay(const BareOverlay&) = delete;
    BareOverlay& operator=(const BareOverlay&) = delete;

    std::vector<std::uint32_t> draw() const {
        std::vector<std::uint32_t> pixels(std::size_t(width) * height);
        cairo_surface_t* surface = cairo_image_surface_create_for_data(
            reinterpret_cast<unsigned char*>(pixels.data()), CAIRO_FORMAT_ARGB32, width, height, width * 4);
        cairo_t* context = cairo_create(surface);
        cairo_set_source_rgba(context, 0, 0, 0, 0.5);
        cairo_set_operator(context, CAIRO_OPERATOR_SOURCE);  // the quicker one
        cairo_rectangle(context, 0, height - bandHeight, width, bandHeight);
        cairo_fill(context);
        cairo_set_operator(context, CAIRO_OPERATOR_OVER);
        cairo_set_source_surface(context, icon_, 2, height - iconSide + 1);
        cairo_paint(context);
        cairo_set_source_rgb(context, 1, 1, 1);
        cairo_move_to(
            context, width - 3 - textWidth_ / double(PANGO_SCALE),
            height + 0.5 - (textHeight_ - pango_layout_get_baseline(layout_)) / double(PANGO_SCALE));
        pango_cairo_show_layout_line(context, pango_layout_get_line_readonly(layout_, 0));
        cairo_destroy(context);
        cairo_surface_destroy(surface);
        return pixels;
    }

  private:
    platform::Bitmap iconPixels_;
    PangoContext* const context_ = pango_font_map_create_context(pango_cairo_font_map_get_default());
    PangoLayout* const layout_;
    cairo_surface_t* const icon_;
    int textWidth_ = 0, textHeight_ = 0;
};

int whitePixelsOnTheRight(const std::vector<std::uint32_t>& pixels) {
    int count = 0;
    for (int y = height - bandHeight; y < height; ++y) {
        for (int x = width / 2; x < width; ++x)
            count += (pixels[std::size_t(y * width + x)] & 255) > 200;
    }
    return count;
}

// Whether both drew a band, the icon, and about as much text.
bool areAlike(const std::vector<std::uint32_t>& one, const std::vector<std::uint32_t>& other) {
    const int text = whitePixelsOnTheRight(one), otherText = whitePixelsOnTheRight(other);
    if (one.size() != other.size() || text < 10 || otherText < text / 2 || otherText > text * 2)
        return false;
    for (std::size_t y = 0; y < height; ++y) {
        if (!std::equal(&one[y * width], &one[y * width + width / 2], &other[y * width]))
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

    std::vector<std::uint32_t> overlay(const vexo::VXMediaObjectRef& item) const {
        const auto image = manager().thumbnailOverlayForMediaObject(item, {}, {width, height});
        return image->picture()->draw(width, height).value().pixels;
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

// Makes and draws the overlays of a list again and again, as scrolling does. Processor time, which is less
// disturbed by what else runs.
void MakeAndDrawOverlays(benchmark::State& state) {
    const LoadedPlugin plugin;
    const BareOverlay bare(*plugin.manager().iconNamed("MBReelixAppIconSmall")->picture());
    if (!areAlike(bare.draw(), plugin.overlay(plugin.movie(125))))
        return state.SkipWithError("the overlay is not what the floor draws");
    std::vector<vexo::VXMediaObjectRef> movies;
    for (int i = 0; i < durations; ++i)
        movies.push_back(plugin.movie(60 + 3 * i));

    std::chrono::nanoseconds time{}, floorTime{};
    for (auto _ : state) {
        const auto floorStart = bench::processorTimeOfThread();
        for (int i = 0; i < durations; ++i)
            benchmark::DoNotOptimize(bare.draw());
        const auto start = bench::processorTimeOfThread();
        for (const auto& movie : movies)
            benchmark::DoNotOptimize(plugin.overlay(movie));
        const auto end = bench::processorTimeOfThread();
        state.SetIterationTime(std::chrono::duration<double>(end - start).count());
        time += end - start;
        floorTime += start - floorStart;
    }
    const double count = durations * double(state.iterations());
    state.counters["us_per_overlay"] = microseconds(time) / count;
    state.counters["floor_us"] = microseconds(floorTime) / count;
    state.counters["to_floor"] = microseconds(time) / microseconds(floorTime);
}
BENCHMARK(MakeAndDrawOverlays)->UseManualTime()->Unit(benchmark::kMicrosecond);

}  // namespace

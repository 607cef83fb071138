// The one way into this library.
#include <string_view>

#include "platform/Renderer.h"
#include "platform/linux/RendererModule.h"
#include "platform/linux/drawing/CairoPicture.h"
#include "platform/linux/drawing/DrawingPlayer.h"
#include "platform/linux/drawing/TextLayout.h"

namespace platform {
namespace {

class CairoRenderer final : public Renderer {
  public:
    std::shared_ptr<const Picture> pictureOfData(std::span<const std::byte> data) const override {
        return newDataPicture(data);
    }
    std::optional<Bitmap> draw(const Bitmap& bitmap, int width, int height) const override {
        return scaled(bitmap, width, height);
    }
    std::optional<Bitmap> draw(const RecordedDrawing& drawing, int width, int height) const override {
        return played(drawing, width, height);
    }
    bool drawOver(Bitmap& bitmap, const RecordedDrawing& drawing) const override {
        return playOver(bitmap, drawing);
    }
    bool drawOver(Bitmap& bitmap, const Bitmap& drawn) const override { return layOver(bitmap, drawn); }
    Size sizeOf(const AttributedString& text) const override {
        const TextLine* line = lineOf(text);
        return line ? line->size() : Size{};
    }
    std::vector<std::byte> pngData(const Bitmap& bitmap) const override { return encodedPNG(bitmap); }
};

}  // namespace
}  // namespace platform

// Pictures may be drawn as long as any thread runs, so the renderer is never destroyed.
const platform::Renderer* vexoRenderer(const char* version) {
    static const auto* const renderer = new platform::CairoRenderer;
    return std::string_view(version) == VEXO_VERSION ? renderer : nullptr;
}

// Movies whose every pixel a test chooses: AVI files of uncompressed pictures.
#pragma once

#include <cstdint>
#include <functional>
#include <string>

namespace vexo {

struct RawMovie {
    using Colour = std::uint32_t;  // 0xRRGGBB

    int width = 64;
    int height = 48;
    int frames = 10;
    int missingFrames = 0;  // that the headers tell of as well
    int framesPerSecond = 10;
    bool everyFrameIsKey = true;  // else the first alone
    std::string date = {};        // "Wed Dec 31 23:59:59 2008"; empty for none
    std::function<Colour(int frame, int x, int y)> colourAt;

    std::string bytes() const { return chunk("RIFF", "AVI " + list("hdrl", headers()) + movie()); }

  private:
    static std::string number(std::uint64_t value, int size) {
        std::string text;
        for (int i = 0; i < size; ++i)
            text += static_cast<char>(value >> 8 * i);
        return text;
    }
    template <typename... Numbers>
    static std::string numbers(Numbers... values) {
        return (number(static_cast<std::uint64_t>(values), 4) + ...);
    }
    static std::string chunk(const std::string& name, const std::string& content) {
        return name + number(content.size(), 4) + content + std::string(content.size() % 2, '\0');
    }
    static std::string list(const std::string& name, const std::string& content) {
        return chunk("LIST", name + content);
    }

    std::string headers() const {
        const std::string main = numbers(1'000'000 / framesPerSecond, 0, 0, hasIndex, frames + missingFrames,
                                         0, 1, pictureSize(), width, height, 0, 0, 0, 0);
        const std::string stream =
            "vidsDIB " + numbers(0, 0, 0, 1, framesPerSecond, 0, frames + missingFrames, pictureSize()) +
            numbers(-1, 0) + numbers(0, 0);
        const std::string picture =
            numbers(40, width, height) + number(1, 2) + number(24, 2) + numbers(0, pictureSize(), 0, 0, 0, 0);
        return chunk("avih", main) + list("strl", chunk("strh", stream) + chunk("strf", picture)) +
               (date.empty() ? "" : chunk("IDIT", date + '\n' + '\0'));
    }

    std::string movie() const {
        std::string pictures = "movi";
        std::string index;
        for (int frame = 0; frame < frames; ++frame) {
            const bool isKey = everyFrameIsKey || frame == 0;
            index += "00db" + numbers(isKey ? keyFrame : 0, pictures.size(), pictureSize());
            pictures += chunk("00db", picture(frame));
        }
        return chunk("LIST", pictures) + chunk("idx1", index);
    }

    // Rows from the bottom, each filled up to a multiple of four bytes.
    std::string picture(int frame) const {
        std::string pixels;
        for (int y = height - 1; y >= 0; --y) {
            for (int x = 0; x < width; ++x)
                pixels += number(colourAt(frame, x, y), 3);
            pixels.resize((pixels.size() + 3) / 4 * 4);
        }
        return pixels;
    }

    int pictureSize() const { return (width * 3 + 3) / 4 * 4 * height; }

    static constexpr int hasIndex = 0x10;
    static constexpr int keyFrame = 0x10;
};

}  // namespace vexo

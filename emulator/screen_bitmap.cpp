#include "emulator/screen_bitmap.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <vector>

namespace qn::emu {
namespace {

struct Rgb {
    std::uint8_t r, g, b;
};

constexpr int kDivisionsX = 10;
constexpr int kDivisionsY = 8;
constexpr Rgb kBackground{0, 0, 0};
constexpr Rgb kGrid{70, 70, 70};
constexpr std::array<Rgb, kMaxAnalogChannels> kTraceColours = {
    Rgb{255, 230, 0}, Rgb{0, 220, 0}, Rgb{60, 140, 255}, Rgb{255, 60, 60}};

class Canvas {
  public:
    Canvas() : pixels_(std::size_t(kScreenWidth) * kScreenHeight, kBackground) {}
    void Set(int x, int y, Rgb c) {
        if (x < 0 || y < 0 || x >= kScreenWidth || y >= kScreenHeight) return;
        pixels_[std::size_t(y) * kScreenWidth + std::size_t(x)] = c;
    }
    // A vertical run joining two consecutive trace points.
    void Span(int x, int y0, int y1, Rgb c) {
        for (int y = std::min(y0, y1); y <= std::max(y0, y1); ++y) Set(x, y, c);
    }
    Rgb At(int x, int y) const { return pixels_[std::size_t(y) * kScreenWidth + std::size_t(x)]; }

  private:
    std::vector<Rgb> pixels_;  // top row first
};

void DrawGraticule(Canvas& canvas) {
    for (int d = 0; d <= kDivisionsX; ++d) {
        const int x = std::min(d * kScreenWidth / kDivisionsX, kScreenWidth - 1);
        for (int y = 0; y < kScreenHeight; y += 2) canvas.Set(x, y, kGrid);
    }
    for (int d = 0; d <= kDivisionsY; ++d) {
        const int y = std::min(d * kScreenHeight / kDivisionsY, kScreenHeight - 1);
        for (int x = 0; x < kScreenWidth; x += 2) canvas.Set(x, y, kGrid);
    }
}

// One channel's record across the screen: full height is the channel's range, centred on its
// offset; points are spread over the width (several per column on long records).
void DrawTrace(Canvas& canvas, const ChannelSettings& channel, const SourceRecord& src,
               Rgb colour) {
    const std::size_t n = src.raw.size();
    if (n == 0 || !(channel.range > 0)) return;
    int last_y = -1;
    for (int x = 0; x < kScreenWidth; ++x) {
        const std::size_t i = std::min(n - 1, std::size_t(x) * n / kScreenWidth);
        const double volts = (src.raw[i] - src.y_reference) * src.y_increment + src.y_origin;
        const double fraction = 0.5 - (volts - channel.offset) / channel.range;
        const int y = std::clamp(static_cast<int>(fraction * kScreenHeight), 0, kScreenHeight - 1);
        canvas.Span(x, last_y < 0 ? y : last_y, y, colour);
        last_y = y;
    }
}

void Put16(std::string& out, std::uint32_t v) {
    out += static_cast<char>(v & 0xFF);
    out += static_cast<char>((v >> 8) & 0xFF);
}
void Put32(std::string& out, std::uint32_t v) {
    Put16(out, v & 0xFFFF);
    Put16(out, v >> 16);
}

std::string Encode(const Canvas& canvas) {
    constexpr std::uint32_t kHeaderBytes = 14 + 40;
    constexpr std::uint32_t kRowBytes = (kScreenWidth * 3 + 3) / 4 * 4;
    constexpr std::uint32_t kImageBytes = kRowBytes * kScreenHeight;
    std::string out;
    out.reserve(kHeaderBytes + kImageBytes);
    out += "BM";
    Put32(out, kHeaderBytes + kImageBytes);
    Put32(out, 0);
    Put32(out, kHeaderBytes);
    Put32(out, 40);  // BITMAPINFOHEADER
    Put32(out, kScreenWidth);
    Put32(out, kScreenHeight);  // positive: bottom row first
    Put16(out, 1);              // planes
    Put16(out, 24);             // bits per pixel
    Put32(out, 0);              // no compression
    Put32(out, kImageBytes);
    Put32(out, 2835);  // 72 dpi
    Put32(out, 2835);
    Put32(out, 0);
    Put32(out, 0);
    for (int y = kScreenHeight - 1; y >= 0; --y) {
        std::uint32_t written = 0;
        for (int x = 0; x < kScreenWidth; ++x, written += 3) {
            const Rgb c = canvas.At(x, y);
            out += static_cast<char>(c.b);
            out += static_cast<char>(c.g);
            out += static_cast<char>(c.r);
        }
        for (; written < kRowBytes; ++written) out += '\0';
    }
    return out;
}

}  // namespace

std::string RenderScreenBitmap(const ScopeSettings& settings, const AcquiredRecord& record) {
    Canvas canvas;
    DrawGraticule(canvas);
    for (std::size_t ch = 0; ch < settings.channels.size(); ++ch) {
        if (!settings.channels[ch].display) continue;
        const std::string name = "CHAN" + std::to_string(ch + 1);
        for (const SourceRecord& src : record.sources) {
            if (src.source == name) DrawTrace(canvas, settings.channels[ch], src, kTraceColours[ch]);
        }
    }
    return Encode(canvas);
}

}  // namespace qn::emu

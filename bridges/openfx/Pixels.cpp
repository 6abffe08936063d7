// Conversion of pixels.
#include "bridges/openfx/Pixels.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <string_view>

namespace kyvofx {
namespace {

// R, G, B, A to B, G, R, A and back.
uint32_t SwapRedBlue(uint32_t pixel) {
    return (pixel & 0xFF00FF00) | (pixel << 16 & 0x00FF0000) | (pixel >> 16 & 0x000000FF);
}

uint32_t ByteOf(float part) {
    const float raised = std::min(part, 1.0F) * 255.0F + 0.5F;
    return part > 0 ? static_cast<uint32_t>(raised) : 0;
}

uint32_t Packed(uint32_t r, uint32_t g, uint32_t b, uint32_t a) {
    return b | g << 8 | r << 16 | a << 24;
}

// Rows of pixels from the host's form; premultiplied colours are divided by their alpha before they
// are rounded.
struct ByteForm {
    static constexpr size_t kBytes = 4;

    static void Read(const uint8_t* from, uint32_t* to, size_t count, bool isPremultiplied) {
        for (size_t i = 0; i < count; ++i) {
            uint32_t pixel;
            std::memcpy(&pixel, from + 4 * i, sizeof pixel);
            to[i] = SwapRedBlue(pixel);
        }
        for (size_t i = 0; isPremultiplied && i < count; ++i) {
            const uint32_t a = to[i] >> 24;
            const auto part = [&](int shift) {
                const uint32_t value = to[i] >> shift & 255;
                return a ? std::min((value * 255 + a / 2) / a, 255U) : 0;
            };
            to[i] = a == 255 ? to[i] : Packed(part(16), part(8), part(0), a);
        }
    }

    static void Write(const uint32_t* from, uint8_t* to, size_t count, bool isPremultiplied) {
        for (size_t i = 0; i < count; ++i) {
            uint32_t pixel = from[i];
            const uint32_t a = pixel >> 24;
            if (isPremultiplied && a != 255) {
                const auto part = [&](int shift) {
                    return ((pixel >> shift & 255) * a + 127) / 255;
                };
                pixel = Packed(part(16), part(8), part(0), a);
            }
            pixel = SwapRedBlue(pixel);
            std::memcpy(to + 4 * i, &pixel, sizeof pixel);
        }
    }
};

template <class Channel, uint32_t (*Down)(float), Channel (*Up)(float)>
struct WideForm {
    static constexpr size_t kBytes = 4 * sizeof(Channel);
    static constexpr float kMost = sizeof(Channel) == 2 ? 65535.0F : 1.0F;

    static void Read(const uint8_t* from, uint32_t* to, size_t count, bool isPremultiplied) {
        for (size_t i = 0; i < count; ++i) {
            Channel part[4];
            std::memcpy(part, from + kBytes * i, kBytes);
            float scale = 1 / kMost;
            const float alpha = static_cast<float>(part[3]) / kMost;
            if (isPremultiplied) {
                scale = alpha > 0 ? scale / std::min(alpha, 1.0F) : 0;
            }
            to[i] = Packed(Down(static_cast<float>(part[0]) * scale),
                           Down(static_cast<float>(part[1]) * scale),
                           Down(static_cast<float>(part[2]) * scale), Down(alpha));
        }
    }

    static void Write(const uint32_t* from, uint8_t* to, size_t count, bool isPremultiplied) {
        for (size_t i = 0; i < count; ++i) {
            const uint32_t pixel = from[i];
            const float alpha = static_cast<float>(pixel >> 24) / 255.0F;
            const float scale = isPremultiplied ? alpha : 1.0F;
            const auto part = [&](int shift) {
                return Up(static_cast<float>(pixel >> shift & 255) / 255.0F * scale);
            };
            const Channel parts[4] = {part(16), part(8), part(0), Up(alpha)};
            std::memcpy(to + kBytes * i, parts, kBytes);
        }
    }
};

// v * 257 for a byte's fraction.
uint16_t ShortOf(float part) {
    const float raised = part * 65535.0F + 0.5F;
    return static_cast<uint16_t>(raised);
}

float Same(float part) {
    return part;
}

using ShortForm = WideForm<uint16_t, ByteOf, ShortOf>;
using FloatForm = WideForm<float, ByteOf, Same>;

using ReadRow = void (*)(const uint8_t*, uint32_t*, size_t, bool);
using WriteRow = void (*)(const uint32_t*, uint8_t*, size_t, bool);

struct Form {
    size_t bytes;
    ReadRow read;
    WriteRow write;
};

Form FormOf(Depth depth) {
    switch (depth) {
    case Depth::Byte:
        return {ByteForm::kBytes, ByteForm::Read, ByteForm::Write};
    case Depth::Short:
        return {ShortForm::kBytes, ShortForm::Read, ShortForm::Write};
    default:
        return {FloatForm::kBytes, FloatForm::Read, FloatForm::Write};
    }
}

std::optional<Depth> DepthOf(std::string_view name) {
    if (name == value::kByte) {
        return Depth::Byte;
    }
    if (name == value::kShort) {
        return Depth::Short;
    }
    return name == value::kFloat ? std::optional(Depth::Float) : std::nullopt;
}

uint8_t* PixelAt(const Image& image, int x, int y, size_t pixelBytes) {
    return image.data + (ptrdiff_t{y} - image.bounds.y1) * image.rowBytes +
           (ptrdiff_t{x} - image.bounds.x1) * static_cast<ptrdiff_t>(pixelBytes);
}

} // namespace

int64_t Width(const RectI& rect) {
    return int64_t{rect.x2} - rect.x1;
}

int64_t Height(const RectI& rect) {
    return int64_t{rect.y2} - rect.y1;
}

bool IsEmpty(const RectI& rect) {
    return rect.x1 >= rect.x2 || rect.y1 >= rect.y2;
}

RectI Intersection(const RectI& a, const RectI& b) {
    return {std::max(a.x1, b.x1), std::max(a.y1, b.y1), std::min(a.x2, b.x2), std::min(a.y2, b.y2)};
}

std::optional<Image> ImageOf(const CProps& props) {
    Image image = {};
    image.data = static_cast<uint8_t*>(props.Pointer(prop::kData));
    const std::optional<Depth> depth = DepthOf(props.String(prop::kDepth));
    const bool isRgba = std::string_view(props.String(prop::kComponents)) == value::kRgba;
    if (!image.data || !depth || !isRgba || !props.Ints(prop::kBounds, 4, &image.bounds.x1) ||
        IsEmpty(image.bounds)) {
        return std::nullopt;
    }
    image.depth = *depth;
    const int64_t packed = Width(image.bounds) * static_cast<int64_t>(FormOf(*depth).bytes);
    const int rowBytes = props.Int(prop::kRowBytes, 0);
    image.rowBytes = rowBytes ? rowBytes : packed; // 0 stands for rows without gaps
    image.isPremultiplied =
        std::string_view(props.String(prop::kPremultiplication)) == value::kPremultiplied;
    return std::abs(int64_t{image.rowBytes}) < packed ? std::nullopt : std::optional(image);
}

void ReadImage(const Image& image, const RectI& area, Frame& frame) {
    const auto width = static_cast<size_t>(Width(area));
    frame.resize(width * static_cast<size_t>(Height(area)));
    const RectI seen = Intersection(image.bounds, area);
    if (IsEmpty(seen) || Width(seen) != Width(area) || Height(seen) != Height(area)) {
        std::fill(frame.begin(), frame.end(), 0);
    }
    const Form form = FormOf(image.depth);
    for (int y = seen.y1; y < seen.y2 && !IsEmpty(seen); ++y) {
        uint32_t* const row = frame.data() + static_cast<size_t>(area.y2 - 1 - y) * width;
        form.read(PixelAt(image, seen.x1, y, form.bytes), row + (seen.x1 - area.x1),
                  static_cast<size_t>(Width(seen)), image.isPremultiplied);
    }
}

void WriteImage(const Frame& frame, const RectI& area, const Image& image, const RectI& window,
                Rows rows) {
    const RectI target = Intersection(image.bounds, window);
    const RectI seen = Intersection(target, area);
    const Form form = FormOf(image.depth);
    for (int y = target.y1; y < target.y2 && !IsEmpty(target); ++y) {
        const bool isOdd = (y & 1) != 0;
        if ((rows == Rows::Even && isOdd) || (rows == Rows::Odd && !isOdd)) {
            continue;
        }
        const bool hasPixels = !IsEmpty(seen) && y >= seen.y1 && y < seen.y2;
        if (!hasPixels || Width(seen) != Width(target)) {
            std::memset(PixelAt(image, target.x1, y, form.bytes), 0,
                        static_cast<size_t>(Width(target)) * form.bytes);
        }
        if (hasPixels) {
            const size_t at =
                static_cast<size_t>(area.y2 - 1 - y) * static_cast<size_t>(Width(area)) +
                static_cast<size_t>(seen.x1 - area.x1);
            form.write(frame.data() + at, PixelAt(image, seen.x1, y, form.bytes),
                       static_cast<size_t>(Width(seen)), image.isPremultiplied);
        }
    }
}

Frame Scaled(const Frame& frame, size_t width, size_t height, size_t newWidth, size_t newHeight) {
    struct Place {
        size_t first, second;
        uint32_t part; // of the second, 256ths
    };
    const auto places = [](size_t from, size_t to) {
        std::vector<Place> all(to);
        for (size_t i = 0; i < to; ++i) {
            const double at = (static_cast<double>(i) + 0.5) * static_cast<double>(from) /
                                  static_cast<double>(to) -
                              0.5;
            const double low = std::clamp(std::floor(at), 0.0, static_cast<double>(from - 1));
            all[i].first = static_cast<size_t>(low);
            all[i].second = std::min(all[i].first + 1, from - 1);
            all[i].part = static_cast<uint32_t>(std::clamp((at - low) * 256 + 0.5, 0.0, 256.0));
        }
        return all;
    };
    const std::vector<Place> columns = places(width, newWidth), lines = places(height, newHeight);
    Frame scaled(newWidth * newHeight);
    for (size_t y = 0; y < newHeight; ++y) {
        const uint32_t* const upper = frame.data() + lines[y].first * width;
        const uint32_t* const lower = frame.data() + lines[y].second * width;
        for (size_t x = 0; x < newWidth; ++x) {
            const Place& column = columns[x];
            uint32_t pixel = 0;
            for (int shift = 0; shift < 32; shift += 8) {
                const auto mix = [&](const uint32_t* row) {
                    return (row[column.first] >> shift & 255) * (256 - column.part) +
                           (row[column.second] >> shift & 255) * column.part;
                };
                // 16 bits of fraction, rounded to the nearest.
                const uint32_t sum =
                    mix(upper) * (256 - lines[y].part) + mix(lower) * lines[y].part;
                pixel |= ((sum + 0x8000) >> 16) << shift;
            }
            scaled[y * newWidth + x] = pixel;
        }
    }
    return scaled;
}

} // namespace kyvofx

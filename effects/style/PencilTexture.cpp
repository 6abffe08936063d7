// Drawing strokes and paper.
#include "effects/style/PencilTexture.h"

#include <algorithm>
#include <cmath>
#include <cstring>

namespace kyv {
namespace {

constexpr int32_t kSide = CPencilTexture::kSide;

// Numbers of 0..1, the same for the same seed everywhere.
class CSequence {
public:
    explicit CSequence(uint32_t seed) : m_state(seed * 2654435769U + 1) {}

    float Next() {
        m_state = m_state * 1664525U + 1013904223U;
        uint32_t n = m_state;
        n = (n ^ n >> 16) * 0x7FEB352DU;
        return static_cast<float>((n ^ n >> 15) >> 8) / 16777216.0F;
    }
    // From -1 to 1.
    float Around() { return Next() * 2.0F - 1.0F; }

private:
    uint32_t m_state;
};

// A line of direction (x, y) closes on a tile after a number of turns when both are whole numbers,
// and lines that are evenly spaced stay so over the seam.
struct Direction {
    int32_t x;
    int32_t y;
};
constexpr Direction kDirections[kHatchLayers] = {{2, -3}, {3, -2}, {1, 1}, {3, -1}};

constexpr int32_t Wrap(int32_t i) {
    const int32_t rest = i % kSide;
    return rest < 0 ? rest + kSide : rest;
}

// A stroke from a place along a unit vector, its relief highest in the middle and tapering at both
// ends. bend moves the middle sideways.
struct Stroke {
    float x, y;
    float ux, uy;
    float length;
    float halfWidth;
    float pressure;
    float bend;
};

void DrawStroke(uint8_t* tile, const Stroke& stroke) {
    const bool steep = std::fabs(stroke.uy) > std::fabs(stroke.ux);
    const float along = steep ? stroke.uy : stroke.ux; // of the axis that is walked
    const float across = steep ? stroke.ux : stroke.uy;
    const float start = steep ? stroke.y : stroke.x;
    const float side = steep ? stroke.x : stroke.y;
    const float end = start + along * stroke.length;
    const auto first = static_cast<int32_t>(std::floor(std::min(start, end)));
    const auto last = static_cast<int32_t>(std::ceil(std::max(start, end)));
    const float reach = stroke.halfWidth / std::fabs(along) + 1.0F;
    for (int32_t i = first; i <= last; ++i) {
        const float t = (static_cast<float>(i) - start) / (along * stroke.length);
        if (t < 0.0F || t > 1.0F) {
            continue;
        }
        const float arch = 4.0F * t * (1.0F - t);
        const float centre =
            side + (static_cast<float>(i) - start) * across / along + stroke.bend * arch;
        // The pencil is set down briskly and lifted slowly.
        const float taper = std::min({t * 7.0F, (1.0F - t) * 2.2F, 1.0F});
        const float height =
            stroke.pressure * (0.35F + 0.65F * taper) * std::min(taper * 4.0F, 1.0F);
        const auto from = static_cast<int32_t>(std::ceil(centre - reach));
        const auto to = static_cast<int32_t>(std::floor(centre + reach));
        for (int32_t j = from; j <= to; ++j) {
            const float distance =
                (static_cast<float>(j) - centre) * std::fabs(along) / stroke.halfWidth;
            const float relief = 1.0F - distance * distance;
            if (relief <= 0.0F) {
                continue;
            }
            const int32_t x = Wrap(steep ? j : i);
            const int32_t y = Wrap(steep ? i : j);
            uint8_t& pixel = tile[static_cast<size_t>(y) * kSide + x];
            const auto value = static_cast<uint8_t>(std::min(relief * height * 255.0F, 255.0F));
            pixel = std::max(pixel, value);
        }
    }
}

// Smooth noise of 0..1 with cells of the tile's side divided by a whole number.
class CTileNoise {
public:
    CTileNoise(int32_t cells, uint32_t seed)
        : m_cells(cells), m_values(static_cast<size_t>(cells) * cells) {
        CSequence sequence(seed);
        for (float& value : m_values) {
            value = sequence.Next();
        }
    }

    float At(int32_t x, int32_t y) const {
        const float scale = static_cast<float>(m_cells) / static_cast<float>(kSide);
        const float u = static_cast<float>(x) * scale;
        const float v = static_cast<float>(y) * scale;
        const auto column = static_cast<int32_t>(u);
        const auto row = static_cast<int32_t>(v);
        float fx = u - static_cast<float>(column);
        float fy = v - static_cast<float>(row);
        fx = fx * fx * (3.0F - 2.0F * fx);
        fy = fy * fy * (3.0F - 2.0F * fy);
        const float top = Value(column, row) * (1.0F - fx) + Value(column + 1, row) * fx;
        const float bottom = Value(column, row + 1) * (1.0F - fx) + Value(column + 1, row + 1) * fx;
        return top * (1.0F - fy) + bottom * fy;
    }

private:
    float Value(int32_t column, int32_t row) const {
        return m_values[static_cast<size_t>(row % m_cells) * m_cells + column % m_cells];
    }

    int32_t m_cells;
    std::vector<float> m_values;
};

int32_t CellsOf(float pixels) {
    return std::clamp(static_cast<int32_t>(static_cast<float>(kSide) / pixels), 2, kSide);
}

} // namespace

void CPencilTexture::DrawHatching(int32_t tile, float spacing, float halfWidth, float length) {
    const Direction direction = kDirections[tile];
    const float norm =
        std::sqrt(static_cast<float>(direction.x * direction.x + direction.y * direction.y));
    const float ux = static_cast<float>(direction.x) / norm;
    const float uy = static_cast<float>(direction.y) / norm;
    const float circuit = static_cast<float>(kSide) * norm;
    const int32_t lines =
        std::max(static_cast<int32_t>(static_cast<float>(kSide) / (spacing * norm)), 1);
    const float step = static_cast<float>(kSide) / (static_cast<float>(lines) * norm);
    uint8_t* pixels = Tile(tile);
    std::fill_n(pixels, size_t{kSide} * kSide, uint8_t{0});
    CSequence sequence(static_cast<uint32_t>(tile) + 17);
    for (int32_t line = 0; line < lines; ++line) {
        const float offset = static_cast<float>(line) * step;
        float at = sequence.Next() * length;
        const float stop = at + circuit - length * 0.4F;
        while (at < stop) {
            const float reach = length * (0.7F + 0.6F * sequence.Next());
            const float aside = offset + sequence.Around() * step * 0.3F;
            const float lean = sequence.Around() * 0.035F; // no two strokes are quite parallel
            DrawStroke(pixels, {.x = -uy * aside + ux * at,
                                .y = ux * aside + uy * at,
                                .ux = ux - uy * lean,
                                .uy = uy + ux * lean,
                                .length = reach,
                                .halfWidth = halfWidth * (0.8F + 0.4F * sequence.Next()),
                                .pressure = 0.82F + 0.18F * sequence.Next(),
                                .bend = sequence.Around() * length * 0.03F});
            at += reach * (0.8F + 0.25F * sequence.Next());
        }
    }
}

void CPencilTexture::DrawNoise(int32_t tile, float scale) {
    uint8_t* pixels = Tile(tile);
    if (tile == kHand) {
        const CTileNoise broad(CellsOf(46.0F * scale), 5);
        const CTileNoise fine(CellsOf(13.0F * scale), 6);
        for (int32_t y = 0; y < kSide; ++y) {
            for (int32_t x = 0; x < kSide; ++x) {
                const float level = 0.6F * broad.At(x, y) + 0.4F * fine.At(x, y);
                *pixels++ = static_cast<uint8_t>(
                    std::clamp((level - 0.5F) * 2.0F + 0.5F, 0.0F, 1.0F) * 255.0F);
            }
        }
        return;
    }
    // The tooth: fibres of a pixel or two of the reference frame on gentle bumps.
    const CTileNoise fibres(CellsOf(std::max(0.8F * scale, 1.0F)), 7);
    const CTileNoise bumps(CellsOf(std::max(1.9F * scale, 2.0F)), 8);
    for (int32_t y = 0; y < kSide; ++y) {
        for (int32_t x = 0; x < kSide; ++x) {
            const float level = 0.45F * fibres.At(x, y) + 0.55F * bumps.At(x, y);
            *pixels++ =
                static_cast<uint8_t>(std::clamp((level - 0.42F) * 2.6F, 0.0F, 0.85F) * 255.0F);
        }
    }
}

void CPencilTexture::Draw(int32_t strokeSize, float scale) {
    if (strokeSize == m_strokeSize && scale == m_scale) {
        return;
    }
    m_strokeSize = 0; // should the allocation fail
    m_tiles.resize(size_t{kTiles} * kSide * kSide);
    const auto size = static_cast<float>(strokeSize);
    const float halfWidth = std::max((0.36F + 0.105F * size) * scale, 0.7F);
    const float spacing = std::max((1.0F + 0.27F * size) * scale, 2.0F);
    const float length = std::min((13.0F + 4.0F * size) * scale, 400.0F);
    for (int32_t tile = 0; tile < kHatchLayers; ++tile) {
        DrawHatching(tile, spacing, halfWidth, length);
    }
    DrawNoise(kValleys, scale);
    DrawNoise(kHand, scale);
    m_strokeSize = strokeSize;
    m_scale = scale;
}

void CPencilTexture::Place(uint32_t texture) {
    CSequence sequence(texture);
    for (Shift& shift : m_shifts) {
        shift.x = static_cast<int32_t>(sequence.Next() * static_cast<float>(kSide)) % kSide;
        shift.y = static_cast<int32_t>(sequence.Next() * static_cast<float>(kSide)) % kSide;
    }
}

void CPencilTexture::CopyRow(uint8_t* dst, int32_t tile, int32_t y, int32_t count) const {
    const Shift& shift = m_shifts[tile];
    const uint8_t* row = m_tiles.data() + static_cast<size_t>(tile) * kSide * kSide +
                         static_cast<size_t>((y + shift.y) % kSide) * kSide;
    for (int32_t from = shift.x; count > 0; from = 0) {
        const int32_t part = std::min(kSide - from, count);
        std::memcpy(dst, row + from, static_cast<size_t>(part));
        dst += part;
        count -= part;
    }
}

} // namespace kyv

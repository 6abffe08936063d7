// The marks that a pencil leaves, as tiles that repeat without a seam: hatching in four directions,
// the tooth of the paper, and the unsteady pressure of the hand.
#pragma once

#include <cstdint>
#include <vector>

#include "effects/style/PencilRow.h"

namespace kyv {

class CPencilTexture {
public:
    static constexpr int32_t kSide = 768;
    static constexpr int32_t kTiles = kHatchLayers + 2;
    static constexpr int32_t kValleys = kHatchLayers;
    static constexpr int32_t kHand = kHatchLayers + 1;

    // Draws the tiles for strokes of a size of 1..10, for a frame that is scale times as wide as
    // the reference. Nothing is done when they are there. Throws std::bad_alloc.
    void Draw(int32_t strokeSize, float scale);

    // Shifts every tile by a place of its own that the number decides.
    void Place(uint32_t texture);

    // Copies a row of a tile, repeated over count pixels.
    void CopyRow(uint8_t* dst, int32_t tile, int32_t y, int32_t count) const;

private:
    uint8_t* Tile(int32_t tile) {
        return m_tiles.data() + static_cast<size_t>(tile) * kSide * kSide;
    }

    void DrawHatching(int32_t tile, float spacing, float halfWidth, float length);
    void DrawNoise(int32_t tile, float scale);

    std::vector<uint8_t> m_tiles;
    int32_t m_strokeSize = 0;
    float m_scale = 0.0F;
    struct Shift {
        int32_t x;
        int32_t y;
    };
    Shift m_shifts[kTiles] = {};
};

} // namespace kyv

// Images for tests of the operations: in memory of their own, with a frame of guard bytes.
#pragma once

#include <algorithm>
#include <cstdint>
#include <random>
#include <vector>

#include "imageutility/ImageUtility.h"

namespace kyvtest {

using KYVImageUtility::CImageARGB;
using KYVImageUtility::CImageAYUV;
using KYVImageUtility::CImageBase;
using KYVImageUtility::CImageByte;

// Pixels as words, row by row: 0xAARRGGBB.
using Words = std::vector<uint32_t>;

// A view that is one part of a larger buffer: guard bytes lie before and after every row, and there
// are pitchFactor - 1 rows of them between two rows.
template <class Image>
class CFramed {
public:
    CFramed(int32_t width, int32_t height, int32_t pitchFactor = 1)
        : m_rowBytes(static_cast<size_t>(width) * kPixelBytes),
          m_pitch((m_rowBytes + 2 * kMargin) * static_cast<size_t>(pitchFactor)),
          m_bytes(m_pitch * (static_cast<size_t>(height) + 2), kGuard),
          m_image(m_bytes.data() + m_pitch + kMargin, width, height,
                  static_cast<int32_t>(m_pitch)) {}

    CFramed(const CFramed&) = delete;
    CFramed& operator=(const CFramed&) = delete;

    Image& operator*() { return m_image; }
    Image* operator->() { return &m_image; }

    void Fill(uint32_t seed) {
        std::mt19937 random(seed);
        for (int32_t y = 0; y < m_image.GetHeight(); ++y) {
            std::generate_n(m_image.Row(y), m_rowBytes,
                            [&random] { return static_cast<uint8_t>(random() >> 11); });
        }
    }

    // True when nothing but the pixels has been written.
    bool GuardsAreIntact() const {
        std::vector<uint8_t> rest = m_bytes;
        for (int32_t y = 0; y < m_image.GetHeight(); ++y) {
            const size_t start = static_cast<size_t>(m_image.Row(y) - m_bytes.data());
            std::fill_n(rest.begin() + static_cast<ptrdiff_t>(start), m_rowBytes, kGuard);
        }
        return std::all_of(rest.begin(), rest.end(), [](uint8_t byte) { return byte == kGuard; });
    }

private:
    static constexpr size_t kPixelBytes = std::is_same_v<Image, CImageByte> ? 1 : 4;
    static constexpr size_t kMargin = 12;
    static constexpr uint8_t kGuard = 0xA5;

    size_t m_rowBytes;
    size_t m_pitch;
    std::vector<uint8_t> m_bytes;
    Image m_image;
};

// The pixels of a 4-byte image.
inline Words WordsOf(const CImageBase& image) {
    Words words;
    for (int32_t y = 0; y < image.GetHeight(); ++y) {
        for (int32_t x = 0; x < image.GetWidth(); ++x) {
            const uint8_t* p = image.Row(y) + static_cast<ptrdiff_t>(x) * 4;
            words.push_back(p[0] | p[1] << 8 | p[2] << 16 | static_cast<uint32_t>(p[3]) << 24);
        }
    }
    return words;
}

inline std::vector<uint8_t> BytesOf(const CImageByte& image) {
    std::vector<uint8_t> bytes;
    for (int32_t y = 0; y < image.GetHeight(); ++y) {
        bytes.insert(bytes.end(), image.Row(y), image.Row(y) + image.GetWidth());
    }
    return bytes;
}

// A view of words that must outlive it.
inline CImageARGB View(Words& words, int32_t width) {
    return CImageARGB(reinterpret_cast<uint8_t*>(words.data()), width,
                      static_cast<int32_t>(words.size()) / width, width * 4);
}

inline CImageByte View(std::vector<uint8_t>& bytes, int32_t width) {
    return CImageByte(bytes.data(), width, static_cast<int32_t>(bytes.size()) / width, width);
}

// Levels that choose each instruction set, and those around them.
inline constexpr int32_t kLevels[] = {-1, 0, 1, 2, 3, 4, 5, 100};

} // namespace kyvtest

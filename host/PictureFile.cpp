// Picture files: kind, completeness, orientation.
#include "host/PictureFile.h"

#include <algorithm>
#include <cstddef>
#include <initializer_list>

namespace kyvhost {
namespace {

using View = std::span<const uint8_t>;

bool StartsWith(View bytes, std::initializer_list<uint8_t> start) {
    return bytes.size() >= start.size() && std::equal(start.begin(), start.end(), bytes.begin());
}

// Bytes behind the end read as 0.
size_t At(View bytes, size_t i) {
    return i < bytes.size() ? size_t{bytes[i]} : size_t{0};
}

// The orientation in the first directory of a TIFF structure, which is also what a JPEG carries.
int OrientationOfTiff(View tiff) {
    const bool little = At(tiff, 0) == 'I';
    const auto number = [&](size_t offset, size_t size) {
        size_t value = 0;
        for (size_t k = 0; k < size; ++k) {
            value = value << 8 | At(tiff, little ? offset + size - 1 - k : offset + k);
        }
        return value;
    };
    const size_t directory = number(4, 4);
    const size_t entries = number(directory, 2);
    for (size_t k = 0; k < entries && directory + k * 12 < tiff.size(); ++k) {
        const size_t entry = directory + 2 + k * 12;
        if (number(entry, 2) == 0x112) {
            const size_t value = number(entry + 8, 2);
            return value >= 1 && value <= 8 ? static_cast<int>(value) : 1;
        }
    }
    return 1;
}

int OrientationOfJpeg(View bytes) {
    for (size_t i = 2; At(bytes, i) == 0xFF && At(bytes, i + 1) != 0xDA;) {
        const size_t length = At(bytes, i + 2) << 8 | At(bytes, i + 3);
        const size_t tiff = i + 10; // behind the marker, the length and "Exif\0\0"
        if (At(bytes, i + 1) == 0xE1 && tiff < bytes.size() &&
            StartsWith(bytes.subspan(i + 4), {'E', 'x', 'i', 'f', 0})) {
            return OrientationOfTiff(bytes.subspan(tiff));
        }
        i += 2 + std::max<size_t>(length, 2);
    }
    return 1;
}

// A PNG that moves says so before its first pixels, and is a video to us.
bool IsAnimated(View bytes) {
    const auto find = [&](std::initializer_list<uint8_t> name) {
        return std::search(bytes.begin(), bytes.end(), name.begin(), name.end());
    };
    const auto control = find({'a', 'c', 'T', 'L'});
    return control != bytes.end() && control < find({'I', 'D', 'A', 'T'});
}

} // namespace

bool IsAnimatedPng(View bytes) {
    return StartsWith(bytes, {0x89, 'P', 'N', 'G'}) && IsAnimated(bytes);
}

PictureKind KindOf(View bytes) {
    if (StartsWith(bytes, {0x89, 'P', 'N', 'G', '\r', '\n', 0x1A, '\n'})) {
        return IsAnimated(bytes) ? PictureKind::None : PictureKind::Png;
    }
    if (StartsWith(bytes, {0xFF, 0xD8, 0xFF})) {
        return PictureKind::Jpeg;
    }
    if (StartsWith(bytes, {'I', 'I', '*', 0}) || StartsWith(bytes, {'M', 'M', 0, '*'})) {
        return PictureKind::Tiff;
    }
    // Two letters alone may begin anything; the size of the file and two zeros follow.
    const bool isBmp = StartsWith(bytes, {'B', 'M'}) && bytes.size() >= 10 &&
                       StartsWith(bytes.subspan(6), {0, 0, 0, 0});
    return isBmp ? PictureKind::Bmp : PictureKind::None;
}

bool IsComplete(View bytes) {
    const PictureKind kind = KindOf(bytes);
    if (kind == PictureKind::Png) {
        constexpr uint8_t kEnd[] = {'I', 'E', 'N', 'D'};
        return std::search(bytes.begin(), bytes.end(), std::begin(kEnd), std::end(kEnd)) !=
               bytes.end();
    }
    if (kind != PictureKind::Jpeg) {
        return true;
    }
    constexpr uint8_t kEnd[] = {0xFF, 0xD9};
    const auto tail = std::find_end(bytes.begin(), bytes.end(), std::begin(kEnd), std::end(kEnd));
    // Behind an end marker long before the end comes an appended preview or a cut-off main scan
    // behind an embedded thumbnail; only the latter leaves a scan's start after it.
    constexpr uint8_t kScan[] = {0xFF, 0xDA};
    return tail != bytes.end() &&
           std::search(tail, bytes.end(), std::begin(kScan), std::end(kScan)) == bytes.end();
}

int Orientation(View bytes) {
    switch (KindOf(bytes)) {
    case PictureKind::Jpeg:
        return OrientationOfJpeg(bytes);
    case PictureKind::Tiff:
        return OrientationOfTiff(bytes);
    default:
        return 1;
    }
}

} // namespace kyvhost

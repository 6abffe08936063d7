// Matroska, as little of it as frames need. Everything is an element: a number that names it, its
// size, and its content. Sizes take eight bytes here, all ones where the end is not known.
#include "host/FrameStream.h"

#include <cmath>
#include <initializer_list>
#include <string_view>

namespace kyvhost {
namespace {

using Bytes = std::vector<uint8_t>;

enum : uint32_t {
    Id_Ebml = 0x1A45DFA3,
    Id_DocType = 0x4282,
    Id_Segment = 0x18538067,
    Id_Info = 0x1549A966,
    Id_TimestampScale = 0x2AD7B1,
    Id_Tracks = 0x1654AE6B,
    Id_TrackEntry = 0xAE,
    Id_TrackNumber = 0xD7,
    Id_TrackUid = 0x73C5,
    Id_TrackType = 0x83,
    Id_CodecId = 0x86,
    Id_DefaultDuration = 0x23E383,
    Id_Video = 0xE0,
    Id_PixelWidth = 0xB0,
    Id_PixelHeight = 0xBA,
    Id_ColorSpace = 0x2EB524,
    Id_Cluster = 0x1F43B675,
    Id_Timestamp = 0xE7,
    Id_SimpleBlock = 0xA3,
};

constexpr uint64_t kUnknownSize = 0x00FFFFFFFFFFFFFF;

void PutNumber(Bytes& to, uint64_t number, int bytes) {
    for (int i = bytes; i-- > 0;) {
        to.push_back(static_cast<uint8_t>(number >> (8 * i)));
    }
}

void PutHead(Bytes& to, uint32_t id, uint64_t size) {
    PutNumber(to, id, id > 0xFFFFFF ? 4 : id > 0xFFFF ? 3 : id > 0xFF ? 2 : 1);
    to.push_back(1); // seven bytes of size follow
    PutNumber(to, size, 7);
}

Bytes Number(uint32_t id, uint64_t number) {
    Bytes bytes;
    PutHead(bytes, id, 8);
    PutNumber(bytes, number, 8);
    return bytes;
}

Bytes Text(uint32_t id, std::string_view text) {
    Bytes bytes;
    PutHead(bytes, id, text.size());
    bytes.insert(bytes.end(), text.begin(), text.end());
    return bytes;
}

Bytes Group(uint32_t id, std::initializer_list<Bytes> members) {
    Bytes content, bytes;
    for (const Bytes& member : members) {
        content.insert(content.end(), member.begin(), member.end());
    }
    PutHead(bytes, id, content.size());
    bytes.insert(bytes.end(), content.begin(), content.end());
    return bytes;
}

void Append(Bytes& to, const Bytes& more) {
    to.insert(to.end(), more.begin(), more.end());
}

} // namespace

Bytes FrameStreamHeader(uint32_t width, uint32_t height, const Rational& rate) {
    Bytes bytes = Group(Id_Ebml, {Text(Id_DocType, "matroska")});
    PutHead(bytes, Id_Segment, kUnknownSize);
    Append(bytes, Group(Id_Info, {Number(Id_TimestampScale, 1)})); // nanoseconds
    const auto duration = static_cast<uint64_t>(std::llround(1e9 / rate.Value()));
    const Bytes video =
        Group(Id_Video, {Number(Id_PixelWidth, width), Number(Id_PixelHeight, height),
                         Text(Id_ColorSpace, "BGRA")});
    Append(bytes,
           Group(Id_Tracks,
                 {Group(Id_TrackEntry, {Number(Id_TrackNumber, 1), Number(Id_TrackUid, 1),
                                        Number(Id_TrackType, 1), Text(Id_CodecId, "V_UNCOMPRESSED"),
                                        Number(Id_DefaultDuration, duration), video})}));
    return bytes;
}

Bytes FrameHeader(int64_t nanoseconds, size_t frameBytes) {
    constexpr uint8_t kBlockHead[] = {0x81, 0, 0, 0x80}; // track 1, no more time, a key frame
    const Bytes time = Number(Id_Timestamp, static_cast<uint64_t>(nanoseconds));
    Bytes block, bytes;
    PutHead(block, Id_SimpleBlock, sizeof kBlockHead + frameBytes);
    block.insert(block.end(), std::begin(kBlockHead), std::end(kBlockHead));
    PutHead(bytes, Id_Cluster, time.size() + block.size() + frameBytes);
    Append(bytes, time);
    Append(bytes, block);
    return bytes;
}

} // namespace kyvhost

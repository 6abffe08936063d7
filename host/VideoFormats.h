// What videos are written as: containers by the name's ending, and codecs.
#pragma once

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

namespace kyvhost {

struct Codec {
    const char* name;                      // for --codec
    const char* title;                     // for messages
    std::vector<std::string> encoder;      // arguments
    const char* pixels;                    // the pixel format
    const char* alphaPixels = nullptr;     // the one with alpha; null when it has none
    const char* deepPixels = nullptr;      // the one for HDR, which 8 bits cannot carry
    bool evenSides = false;                // takes no odd width or height
    std::vector<std::string> interlaced{}; // arguments for frames of two fields
    bool isYuv = true;
};

enum class Times { Any, Constant }; // between frames

struct Container {
    std::vector<const char*> endings; // the first one names it
    const char* muxer;
    std::vector<const char*> codecs;      // by name; the first is the usual one
    const char* alphaCodec = nullptr;     // the usual one for frames with alpha
    std::vector<const char*> sounds{};    // codecs that are copied; "*" for all; empty: no sound
    const char* soundCodec = nullptr;     // what others become
    std::vector<const char*> subtitles{}; // codecs that are copied
    const char* textCodec = nullptr;      // what other subtitles of text become
    bool covers = false, attachments = false, chapters = false, titles = true;
    Times times = Times::Any;
};

// Null when there is no such ending. "-" as a name takes what --output-format says.
const Container* FindContainer(const std::filesystem::path& file);
const Container* FindContainerByName(std::string_view name);

const Codec& FindCodec(std::string_view name);

// Every name, for help and messages.
std::vector<std::string> CodecNames();
std::string VideoEndings();

bool Holds(const std::vector<const char*>& list, std::string_view codec);

} // namespace kyvhost

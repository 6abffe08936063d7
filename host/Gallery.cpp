// The contact sheet.
#include "host/Gallery.h"

#include <algorithm>
#include <cmath>
#include <cstring>

#include "host/AyuvFrame.h"
#include "host/Clip.h"
#include "host/ExitStatus.h"
#include "host/Lettering.h"
#include "host/OutputFile.h"
#include "host/Picture.h"
#include "hosting/Names.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

// Effects work on larger pictures than are shown, as they would in a real clip.
constexpr uint32_t kOversize = 2;
constexpr double kClipSeconds = 20;

constexpr uint32_t kPaper = 0x16191E;
constexpr uint32_t kInk = 0xF2F3F5;
constexpr uint32_t kFaintInk = 0x98A0AB;

// What an effect is shown with. Defaults are made to be started from; some change nothing.
struct Scene {
    const char* identifier;
    double seconds;
    std::vector<std::string> sets;
    const char* note = nullptr; // in place of the settings
};

const Scene kScenes[] = {
    {"Kyv_Dsp_Pfx_RefractiveBubble", 9, {"P3=1"}},
    {"Kyv_Dsp_Pfx_WaterRipple", 6, {"P1=0.5"}},
    {"Kyv_Dsp_Pfx_Bubble", 9, {"P3=1"}},
    {"Kyv_Dsp_Pfx_Fireworks", 4, {"P1=0.9", "P2=1"}},
    {"Kyv_Dsp_Pi_Freeform",
     0,
     {"P0=0.12", "P1=0.2", "P2=0.66", "P3=0.1", "P4=0.72", "P5=0.82", "P6=0.2", "P7=0.7",
      "P16=#101018", "P17=#101018", "P19=150", "P20=6", "P25=#FFF4D6", "P26=#C98A3C"},
     "four free corners, border and shadow"},
    {"DSP_TR_TestAlpha", 0, {"P1=0.5"}},
    {"DSP_TR_AlphaTransition", 0, {"P1=0.5", "P4=on"}},
    {"Kyv_Dsp_Vi_Dreamy", 0, {"P1=20"}},
    {"Kyv_Dsp_Vi_LightRay", 0, {"P2=0.5,0.3"}},
    {"Dsp_Vi_PencilSketch2", 0, {}},
    {"Kyv_Dsp_Co_Temperature", 0, {"P1=-0.5"}},
    {"Kyv_Dsp_Co_WhiteBalance", 0, {"P1=#FFD9A0"}},
};

Scene SceneOf(const EffectDescriptor& effect) {
    for (const Scene& scene : kScenes) {
        if (Normalized(scene.identifier) == Normalized(effect.identifier)) {
            return scene;
        }
    }
    return {effect.identifier, kClipSeconds / 2, {}};
}

// The largest part of the picture that has the wanted shape, resized.
Picture Filling(const Picture& picture, uint32_t width, uint32_t height) {
    const double scale = std::min(double(picture.width) / width, double(picture.height) / height);
    Picture part;
    part.width = std::clamp<uint32_t>(std::lround(width * scale), 1, picture.width);
    part.height = std::clamp<uint32_t>(std::lround(height * scale), 1, picture.height);
    const size_t left = (picture.width - part.width) / 2, top = (picture.height - part.height) / 2;
    part.pixels.resize(size_t{part.width} * part.height * 4);
    for (uint32_t y = 0; y < part.height; ++y) {
        std::memcpy(&part.pixels[size_t{y} * part.width * 4],
                    &picture.pixels[((top + y) * picture.width + left) * 4],
                    size_t{part.width} * 4);
    }
    return Resized(part, width, height);
}

struct Tile {
    Picture picture;
    std::string title, note;
};

Tile RenderTile(const EffectDescriptor& effect, const EffectSettings& settings,
                const Picture& first, const Picture& second) {
    const Scene scene = SceneOf(effect);
    StageOptions stage;
    for (const std::string& set : scene.sets) {
        AddValue(stage, set);
    }
    CClipInstance instance(effect);
    settings.Apply(instance);
    stage.Apply(instance);
    instance.Context().position = std::llround(scene.seconds * 1e7);
    instance.Context().duration = std::llround(kClipSeconds * 1e7);

    const FrameForm form = {settings.ayuv, false};
    Frame firstFrame = first.pixels, secondFrame = second.pixels;
    form.Apply(firstFrame, first.width);
    form.Apply(secondFrame, second.width);
    const uint8_t* const inputs[2] = {firstFrame.data(), secondFrame.data()};
    Picture result = {first.width, first.height, std::vector<uint8_t>(first.pixels.size())};
    instance.Begin({first.width, first.height, false});
    instance.Render(inputs, result.pixels.data(), 0);
    if (settings.ayuv) {
        AyuvToBgra(result.pixels.data(), result.pixels.size() / 4);
    }

    std::vector<std::string> notes;
    if (scene.seconds > 0) {
        notes.push_back("at " + std::to_string(std::lround(scene.seconds)) + " s");
    }
    if (scene.note) {
        notes.emplace_back(scene.note);
    } else {
        for (const std::string& assignment : scene.sets) {
            const size_t equals = assignment.find('=');
            const uint32_t index = FindParam(effect, assignment.substr(0, equals));
            notes.push_back(ParamName(effect, effect.params[index]) + " " +
                            assignment.substr(equals + 1));
        }
    }
    return {std::move(result), EffectName(effect),
            notes.empty() ? "as a new instance has it" : Join(notes, ", ")};
}

// The beginning that fits, with dots for the rest.
std::string Shortened(std::string text, double size, double width) {
    if (TextWidth(text, size) <= width) {
        return text;
    }
    while (!text.empty() && TextWidth(text + "...", size) > width) {
        text.pop_back();
    }
    return text + "...";
}

class CSheet {
public:
    CSheet(uint32_t tiles, uint32_t columns, uint32_t tileWidth, uint32_t tileHeight)
        : m_nColumns(columns), m_nTileWidth(tileWidth), m_nTileHeight(tileHeight),
          m_nUnit(std::max(tileWidth / 25, 8U)) {
        const uint32_t rows = (tiles + columns - 1) / columns;
        m_picture.width = columns * (tileWidth + m_nUnit) + m_nUnit;
        m_picture.height = TitleHeight() + rows * RowHeight() + m_nUnit / 2;
        m_picture.pixels.resize(size_t{m_picture.width} * m_picture.height * 4);
        for (size_t i = 0; i < m_picture.pixels.size(); ++i) {
            m_picture.pixels[i] = i % 4 == 3 ? 255 : static_cast<uint8_t>(kPaper >> (8 * (i % 4)));
        }
    }

    void SetTitle(const std::string& title, const std::string& note) {
        const double size = 1.9 * m_nUnit;
        DrawText(m_picture, m_nUnit, 2.0 * m_nUnit, size, kInk, title);
        DrawText(m_picture, m_nUnit * 2 + TextWidth(title, size), 2.0 * m_nUnit, 1.1 * m_nUnit,
                 kFaintInk, note);
    }

    void Add(const Tile& tile) {
        const uint32_t left = m_nUnit + m_nTiles % m_nColumns * (m_nTileWidth + m_nUnit);
        const uint32_t top = TitleHeight() + m_nTiles / m_nColumns * RowHeight();
        ++m_nTiles;
        const Picture shown = Resized(tile.picture, m_nTileWidth, m_nTileHeight);
        for (uint32_t y = 0; y < m_nTileHeight; ++y) {
            uint8_t* to = &m_picture.pixels[(size_t{top + y} * m_picture.width + left) * 4];
            std::memcpy(to, &shown.pixels[size_t{y} * m_nTileWidth * 4], size_t{m_nTileWidth} * 4);
            for (uint32_t x = 0; x < m_nTileWidth; ++x) {
                to[x * 4 + 3] = 255;
            }
        }
        const double base = top + m_nTileHeight;
        const double titleSize = 1.2 * m_nUnit, noteSize = 0.9 * m_nUnit;
        DrawText(m_picture, left, base + 1.3 * m_nUnit, titleSize, kInk,
                 Shortened(tile.title, titleSize, m_nTileWidth));
        DrawText(m_picture, left, base + 2.4 * m_nUnit, noteSize, kFaintInk,
                 Shortened(tile.note, noteSize, m_nTileWidth));
    }

    const Picture& Finished() const { return m_picture; }

private:
    uint32_t TitleHeight() const { return 3 * m_nUnit; }
    uint32_t RowHeight() const { return m_nTileHeight + 7 * m_nUnit / 2; }

    uint32_t m_nColumns, m_nTileWidth, m_nTileHeight;
    uint32_t m_nUnit; // every distance and letter is measured in it
    uint32_t m_nTiles = 0;
    Picture m_picture;
};

} // namespace

void Gallery(const ModuleDescriptor& module, const GalleryOptions& options) {
    if (!IsPictureName(options.output)) {
        throw CUsageError(TextOf(options.output) + ": name a .png, .jpg, .tif or .bmp picture");
    }
    COutputFile output(options.output, options.overwrite, {options.input, options.input2});
    const Picture first = ReadPicture(options.input), second = ReadPicture(options.input2);
    const uint32_t tileHeight = std::clamp<uint32_t>(
        std::lround(double(options.tileWidth) * first.height / first.width), 8, 4096);
    const uint32_t width = options.tileWidth * kOversize, height = tileHeight * kOversize;
    const Picture a = Filling(first, width, height), b = Filling(second, width, height);

    CSheet sheet(module.effectCount + 2, options.columns, options.tileWidth, tileHeight);
    sheet.SetTitle("KYV DSP", std::to_string(module.effectCount) + " effects, rendered at " +
                                  std::to_string(width) + " x " + std::to_string(height));
    sheet.Add({a, "First input", TextOf(options.input.filename())});
    sheet.Add({b, "Second input", TextOf(options.input2.filename())});
    for (uint32_t i = 0; i < module.effectCount; ++i) {
        sheet.Add(RenderTile(module.effects[i], options.settings, a, b));
    }
    WritePicture(sheet.Finished(), output.Temporary(), output.Name());
    output.Commit();
}

} // namespace kyvhost

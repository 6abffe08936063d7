// The corner pin.
#include "bridges/frei0r/CornerPin.h"

#include <algorithm>
#include <cmath>
#include <cstring>

#include "hosting/Values.h"

namespace kyvfrei0r {
namespace {

// The switches and what they stand for, by the effect's keys.
constexpr const char* kKeyEnable = "P8";
constexpr const char* kPictureEnable = "P12";
constexpr const char* kPictureAlpha = "P13";
constexpr const char* kPictureBlur = "P14";
constexpr const char* kShadowEnable = "P15";
constexpr const char* kBorderEnable = "P23";

// A, B, C, D: x and y of each, from the top left clockwise.
constexpr double kFrameCorners[8] = {0, 0, 1, 0, 1, 1, 0, 1};

constexpr uint32_t kBlack = 0xFF000000;
constexpr uint32_t kWhite = 0xFFFFFFFF;

uint32_t ByteOf(double part) {
    return static_cast<uint32_t>(std::lround(std::clamp(part, 0.0, 1.0) * 255));
}

// a * b / 255, rounded.
uint32_t Scaled(uint32_t a, uint32_t b) {
    return (a * b + 127) / 255;
}

// How much of the picture there is where a pixel has these values over black and over white. Even a
// solid picture lets a 256th of the background through, which is at most 1 here.
uint32_t Coverage(const uint8_t* overBlack, const uint8_t* overWhite) {
    int rest = 0;
    for (int i = 0; i < 3; ++i) {
        rest = std::max(rest, overWhite[i] - overBlack[i]);
    }
    return rest <= 1 ? 255 : static_cast<uint32_t>((255 * (255 - rest) + 127) / 254);
}

} // namespace

CCornerPin::CCornerPin(const PluginTable& table, const EffectDescriptor& effect, uint32_t width,
                       uint32_t height)
    : CEffectPlugin(table, effect, width, height) {}

void CCornerPin::SetOwn(const ParamTable& param, const void* value) {
    if (param.mapping == Mapping::BackgroundColor) {
        Frei0rColor color;
        std::memcpy(&color, value, sizeof color);
        float* const parts[3] = {&color.r, &color.g, &color.b};
        for (float* part : parts) {
            *part = std::isfinite(*part) ? std::clamp(*part, 0.0F, 1.0F) : 0;
        }
        m_color = color;
    } else {
        double opacity;
        std::memcpy(&opacity, value, sizeof opacity);
        m_opacity = std::isfinite(opacity) ? std::clamp(opacity, 0.0, 1.0) : 0;
    }
}

void CCornerPin::GetOwn(const ParamTable& param, void* value) const {
    if (param.mapping == Mapping::BackgroundColor) {
        std::memcpy(value, &m_color, sizeof m_color);
    } else {
        std::memcpy(value, &m_opacity, sizeof m_opacity);
    }
}

bool CCornerPin::IsNeutral() const {
    const auto number = [this](const char* key) {
        const uint32_t index = *Instance().IndexOf(key);
        return kyvhosting::ComponentOf(Instance().Effect().params[index], Instance().Value(index),
                                       0);
    };
    for (uint32_t i = 0; i < 8; ++i) {
        if (kyvhosting::ComponentOf(Instance().Effect().params[i], Instance().Value(i), 0) !=
            kFrameCorners[i]) {
            return false;
        }
    }
    return number(kPictureEnable) != 0 && number(kPictureAlpha) == 255 &&
           number(kPictureBlur) == 0 && number(kKeyEnable) == 0 && number(kShadowEnable) == 0 &&
           number(kBorderEnable) == 0;
}

KyvStatus CCornerPin::RenderOver(uint32_t background, const void* picture, Frame& result) {
    if (m_background.size() != Pixels() || m_backgroundPixel != background) {
        m_background.assign(Pixels(), background);
        m_backgroundPixel = background;
    }
    result.resize(Pixels());
    return Instance().Render(result.data(), m_background.data(), picture);
}

// The input's alpha at its place, opaque elsewhere: what stands in the picture's way (key, border,
// shadow) is left out.
KyvStatus CCornerPin::RenderAlpha(const void* input, Frame& result) {
    m_grey.resize(Pixels());
    const auto* const bytes = static_cast<const uint8_t*>(input);
    for (size_t i = 0; i < Pixels(); ++i) {
        m_grey[i] = 0xFF000000 | bytes[4 * i + 3] * 0x010101U;
    }
    const std::vector<uint8_t> values = Instance().Params();
    for (const char* key : {kKeyEnable, kShadowEnable, kBorderEnable}) {
        Instance().Set(key, int32_t{0});
    }
    const KyvStatus status = RenderOver(kWhite, m_grey.data(), result);
    std::copy(values.begin(), values.end(), Instance().Params().begin());
    return status;
}

// From the frames over black and white into the output; alpha is the frame of RenderAlpha or null
// where the input is solid.
void CCornerPin::Compose(uint8_t* output, const uint8_t* alpha) const {
    const uint32_t color[3] = {ByteOf(m_color.b), ByteOf(m_color.g), ByteOf(m_color.r)};
    const uint32_t opacity = ByteOf(m_opacity);
    const auto* black = reinterpret_cast<const uint8_t*>(m_overBlack.data());
    const auto* white = reinterpret_cast<const uint8_t*>(m_overWhite.data());
    for (size_t i = 0; i < Bytes(); i += 4) {
        const uint32_t covered = Coverage(black + i, white + i);
        const uint32_t part = alpha ? Scaled(covered, alpha[i]) : covered;
        const uint32_t behind = Scaled(opacity, 255 - part);
        const uint32_t total = part + behind;
        output[i + 3] = static_cast<uint8_t>(total);
        for (size_t k = 0; k < 3; ++k) {
            uint32_t value = color[k];
            if (part > 0) {
                const uint32_t own =
                    std::min<uint32_t>((black[i + k] * 255U + covered / 2) / covered, 255);
                value = (own * part + value * behind + total / 2) / total;
            }
            output[i + k] = static_cast<uint8_t>(value);
        }
    }
}

KyvStatus CCornerPin::Render(const void* input, const void*, void* output) {
    if (IsNeutral()) {
        std::memcpy(output, input, Bytes());
        return KYV_OK;
    }
    const auto* const bytes = static_cast<const uint8_t*>(input);
    bool isSolid = true;
    for (size_t i = 3; i < Bytes() && isSolid; i += 4) {
        isSolid = bytes[i] == 255;
    }
    const uint32_t background = ByteOf(m_opacity) << 24 | ByteOf(m_color.r) << 16 |
                                ByteOf(m_color.g) << 8 | ByteOf(m_color.b);
    KyvStatus status = KYV_OK;
    if (isSolid && background >> 24 == 255) {
        status = RenderOver(background, input, m_overBlack);
        std::memcpy(output, m_overBlack.data(), Bytes());
        return status;
    }
    status = RenderOver(kBlack, input, m_overBlack);
    if (status == KYV_OK) {
        status = RenderOver(kWhite, input, m_overWhite);
    }
    if (status == KYV_OK && !isSolid) {
        status = RenderAlpha(input, m_alpha);
    }
    if (status == KYV_OK) {
        Compose(static_cast<uint8_t*>(output),
                isSolid ? nullptr : reinterpret_cast<const uint8_t*>(m_alpha.data()));
    }
    return status;
}

} // namespace kyvfrei0r

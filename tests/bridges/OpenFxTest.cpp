// The OpenFX bundle in a small host, against the module itself.
#include <algorithm>
#include <array>
#include <cmath>
#include <cstring>
#include <limits>
#include <set>
#include <thread>

#include <gmock/gmock.h>

#include "hosting/Names.h"
#include "tests/bridges/OpenFxHost.h"
#include "tests/support/TestHost.h"

namespace {

using namespace kyvofx;
using kyvtest::COfxInstance;
using kyvtest::CTestInstance;
using kyvtest::Frame;
using kyvtest::OfxEffect;
using kyvtest::OfxLayout;
using kyvtest::OfxPlugins;
using kyvtest::OfxProps;
using kyvtest::RandomFrame;

constexpr int kWidth = 96, kHeight = 54;
constexpr RectI kBounds = {0, 0, kWidth, kHeight};
constexpr double kTime = 62; // at 25 frames a second: 2.48 s
const Frame kBlank(size_t{kWidth} * kHeight, 0x11223344);

std::vector<std::string> Names() {
    std::vector<std::string> names;
    for (const Plugin* const plugin : OfxPlugins()) {
        names.push_back(std::string(plugin->identifier).substr(std::strlen("kyv.dsp.")));
    }
    return names;
}

const EffectDescriptor& EffectOf(const std::string& name) {
    for (uint32_t i = 0; i < kyvtest::Module().effectCount; ++i) {
        if (kyvhosting::ShortName(kyvtest::Module().effects[i]) == name) {
            return kyvtest::Module().effects[i];
        }
    }
    ADD_FAILURE() << "what is " << name << "?";
    std::abort();
}

Frame Input(int number) {
    Frame frame = RandomFrame(size_t{kWidth} * kHeight, static_cast<uint32_t>(number));
    // Half of it solid, as videos are.
    for (size_t i = 0; i < frame.size() / 2; ++i) {
        frame[i] |= 0xFF000000;
    }
    return frame;
}

// As the module renders it for a host of its own, with a clip of 100 frames at 25 a second.
Frame ByModule(CTestInstance& instance, const Frame& a, const Frame& b,
               double frameNumber = kTime) {
    instance.Context().cpuLevel = int32_t{CpuLevel_Avx2} | int32_t{CpuLevelOption_WideMap};
    instance.Context().position = std::llround(frameNumber * 400'000);
    instance.Context().duration = 40'000'000;
    Frame output(a.size(), 0xCDCDCDCD);
    EXPECT_EQ(instance.Begin(), KYV_OK);
    EXPECT_EQ(instance.Render(output.data(), a.data(), b.data()), KYV_OK);
    if (std::string_view(instance.Effect().identifier) == "Kyv_Dsp_Pfx_WaterRipple") {
        for (size_t i = 0; i < a.size(); ++i) { // alpha stays the picture's
            output[i] = (output[i] & 0xFFFFFF) | (a[i] & 0xFF000000);
        }
    }
    return output;
}

// Settings of both sides that are neither neutral nor an end.
void Prepare(COfxInstance& bridged, CTestInstance& own) {
    const EffectDescriptor& effect = own.Effect();
    if (effect.properties.isTransition) {
        bridged.Set("Transition", {0.375});
        own.Set("P1", 0.375F);
    } else if (effect.properties.family == EffectFamily_Color) {
        if (effect.params[0].type == ParamType_Color) {
            bridged.Set("P1", {1, 0.8, 0.6});
            own.Set("P1", 0x99CCFFU); // red in the lowest byte
        } else {
            bridged.Set("P1", {-0.5});
            own.Set("P1", -0.5F);
        }
    }
    // Points are canonical, and their defaults fractions of the project, which a host multiplies.
    for (auto& [name, param] : bridged.Effect().params) {
        if (param.type == paramtype::kDouble2D) {
            param.values = {param.values[0] * kWidth, param.values[1] * kHeight};
        }
    }
}

// Connects the clips, renders and gives what is in the output.
Frame Render(COfxInstance& instance, const Frame& a, const Frame& b, const OfxLayout& layout = {},
             double time = kTime) {
    const std::vector<std::string> sources = instance.Sources();
    instance.Connect(sources[0], a, kBounds, layout);
    if (sources.size() > 1) {
        instance.Connect(sources[1], b, kBounds, layout);
    }
    instance.Connect(clip::kOutput, kBlank, kBounds, layout);
    OfxProps in = instance.RenderArguments(time, kBounds);
    EXPECT_EQ(instance.Act(action::kRender, &in), kStatOk);
    const auto& image = *instance.Effect().clips[clip::kOutput].image;
    EXPECT_TRUE(image.IsGapUntouched());
    return image.Pixels();
}

TEST(OpenFxTest, EveryEffectIsDescribed) {
    std::set<std::string> identifiers;
    std::map<std::string, int> contexts;
    for (Plugin* const plugin : OfxPlugins()) {
        SCOPED_TRACE(plugin->identifier);
        EXPECT_STREQ(plugin->api, kImageEffectApi);
        EXPECT_EQ(plugin->apiVersion, 1);
        identifiers.insert(plugin->identifier);
        OfxEffect effect;
        EXPECT_EQ(OfxDescribe(*plugin, effect), kStatOk);
        const std::vector<std::string> order = effect.order;
        EXPECT_EQ(OfxDescribe(*plugin, effect), kStatOk); // some hosts do it twice
        ++contexts[effect.props.String(prop::kSupportedContexts)];
        EXPECT_EQ(effect.props.String(prop::kSupportedDepths, 0), value::kByte);
        EXPECT_EQ(effect.props.String(prop::kSupportedDepths, 2), value::kFloat);
        EXPECT_THAT(effect.props.String(prop::kLabel), testing::StartsWith("KYV "));
        EXPECT_THAT(effect.props.String(prop::kDescription), testing::HasSubstr("8 bits"));
        EXPECT_EQ(effect.clips.count(clip::kOutput), 1U);
        EXPECT_EQ(std::set<std::string>(order.begin(), order.end()).size(), order.size());
        for (const auto& [name, param] : effect.params) {
            SCOPED_TRACE(name);
            EXPECT_NE(param.props.String(prop::kLabel), "");
            if (param.type == paramtype::kInteger) {
                EXPECT_LE(param.props.Int(prop::kMin), param.props.Int(prop::kDefault));
                EXPECT_GE(param.props.Int(prop::kMax), param.props.Int(prop::kDefault));
            } else if (param.type == paramtype::kChoice) {
                EXPECT_GE(param.props.Count(prop::kChoiceOption), 2U);
            } else if (param.type == paramtype::kRgb) {
                EXPECT_EQ(param.props.Count(prop::kDefault), 3U);
            }
            const std::string parent = param.props.String(prop::kParent);
            EXPECT_TRUE(parent.empty() || effect.params.at(parent).type == paramtype::kGroup);
        }
        OfxProps in;
        in.Set(prop::kContext, {std::string("OfxImageEffectContextPaint")});
        EXPECT_EQ(
            plugin->mainEntry(action::kDescribeInContext, effect.Handle(), in.Handle(), nullptr),
            kStatErrUnsupported);
    }
    EXPECT_EQ(identifiers.size(), kyvtest::Module().effectCount);
    EXPECT_EQ(contexts[context::kFilter], 9);
    EXPECT_EQ(contexts[context::kGeneral], 1);
    EXPECT_EQ(contexts[context::kTransition], 2);
}

TEST(OpenFxTest, TextsAreTheModules) {
    const COfxInstance dreamy("dreamy");
    const OfxEffect& effect = dreamy.Descriptor();
    EXPECT_EQ(effect.props.String(prop::kLabel),
              "KYV " + kyvhosting::EffectName(EffectOf("dreamy")));
    EXPECT_NE(effect.params.at("P1").props.String(prop::kLabel), "");
    const COfxInstance pip("freeform-picture-in-picture");
    const auto& gradient = pip.Descriptor().params.at("P27");
    EXPECT_EQ(gradient.props.Count(prop::kChoiceOption), 8U);
    // A text that only a language library has; the key says "UL".
    EXPECT_NE(gradient.props.String(prop::kChoiceOption, 4), "UL");
    EXPECT_EQ(gradient.props.String(prop::kParent), "Border");
}

TEST(OpenFxTest, FramesAreTheModulesInEveryLayoutAndDepth) {
    const OfxLayout layouts[] = {{},
                                 {.padding = 12},
                                 {.isTopDown = true},
                                 {.depth = value::kShort, .padding = 6},
                                 {.depth = value::kFloat, .isTopDown = true},
                                 {.depth = value::kFloat, .padding = 5}};
    const Frame a = Input(1), b = Input(2);
    for (const std::string& name : Names()) {
        CTestInstance own(EffectOf(name), kWidth, kHeight);
        COfxInstance bridged(name);
        Prepare(bridged, own);
        const Frame expected = ByModule(own, a, b);
        for (const OfxLayout& layout : layouts) {
            EXPECT_EQ(Render(bridged, a, b, layout), expected)
                << name << " " << layout.depth << " " << layout.padding << layout.isTopDown;
        }
    }
}

// 0.5 is 127.5, which is rounded up; what is out of range or no number is clamped.
TEST(OpenFxTest, FloatsAreRoundedToTheNearest) {
    COfxInstance bridged("color-temperature"); // neutral: the pixels pass
    const Frame a(kBlank.size(), 0xFF000000);
    bridged.Connect(clip::kSource, a, kBounds, {.depth = value::kFloat});
    bridged.Connect(clip::kOutput, kBlank, kBounds, {.depth = value::kFloat});
    auto* const pixels = static_cast<float*>(
        bridged.Effect().clips[clip::kSource].image->props.Pointer(prop::kData));
    const float numbers[] = {0.5F, 2.0F, -1.0F, std::nanf(""), 0.0019F, 0.00197F, INFINITY, 1.0F};
    const uint32_t rounded[] = {128, 255, 0, 0, 0, 1, 255, 255};
    for (size_t i = 0; i < 8; ++i) {
        pixels[4 * i] = numbers[i]; // the red of the lowest row
    }
    OfxProps in = bridged.RenderArguments(0, kBounds);
    EXPECT_EQ(bridged.Act(action::kRender, &in), kStatOk);
    const Frame result = bridged.Effect().clips[clip::kOutput].image->Pixels();
    for (size_t i = 0; i < 8; ++i) {
        EXPECT_EQ(result[size_t{kWidth} * (kHeight - 1) + i] >> 16 & 255, rounded[i]) << i;
    }
}

TEST(OpenFxTest, PremultipliedColorsAreStraightForTheEffect) {
    COfxInstance bridged("color-temperature");
    const OfxLayout layout = {.isPremultiplied = true};
    // 0x40 at alpha 0x80 stands for 0x80; neutral, so it comes back as it went.
    const Frame half(kBlank.size(), 0x80402010);
    EXPECT_EQ(Render(bridged, half, half, layout), half);
    // Warmth is the module's at the straight colour.
    bridged.Set("P1", {-0.5});
    CTestInstance own(EffectOf("color-temperature"), kWidth, kHeight);
    own.Set("P1", -0.5F);
    const Frame straight(kBlank.size(), 0x80804020);
    const uint32_t expected = ByModule(own, straight, straight)[0];
    const uint32_t shown = Render(bridged, half, half, layout)[0];
    for (int shift = 0; shift < 24; shift += 8) {
        EXPECT_NEAR(shown >> shift & 255, ((expected >> shift & 255) * 128 + 127) / 255, 1);
    }
}

// Only the window is written, and a tile has the pixels of the whole.
TEST(OpenFxTest, WindowsAndTilesArePartsOfTheWhole) {
    const Frame a = Input(3), b = Input(4);
    COfxInstance bridged("dreamy");
    const Frame whole = Render(bridged, a, b);
    const RectI window = {10, 20, 50, 33};
    bridged.Connect(clip::kOutput, kBlank, kBounds);
    OfxProps in = bridged.RenderArguments(kTime, window);
    EXPECT_EQ(bridged.Act(action::kRender, &in), kStatOk);
    const Frame part = bridged.Effect().clips[clip::kOutput].image->Pixels();
    // A tile: the image is the window alone, and tells the region it is of.
    bridged.Connect(clip::kOutput, Frame(40 * 13, 0x11223344), window);
    auto& tile = *bridged.Effect().clips[clip::kOutput].image;
    tile.props.Set(prop::kImageRegion, {0, 0, kWidth, kHeight});
    EXPECT_EQ(bridged.Act(action::kRender, &in), kStatOk);
    const Frame alone = tile.Pixels();
    for (int y = 0; y < kHeight; ++y) {
        for (int x = 0; x < kWidth; ++x) {
            const size_t at = static_cast<size_t>((kHeight - 1 - y) * kWidth + x);
            const bool isInside = x >= 10 && x < 50 && y >= 20 && y < 33;
            ASSERT_EQ(part[at], isInside ? whole[at] : 0x11223344) << x << "," << y;
            if (isInside) {
                ASSERT_EQ(alone[static_cast<size_t>((32 - y) * 40 + x - 10)], whole[at]);
            }
        }
    }
}

TEST(OpenFxTest, FieldsLeaveTheOtherRowsAlone) {
    const Frame a = Input(5), b = Input(6);
    for (const std::string& name : Names()) {
        COfxInstance bridged(name);
        CTestInstance own(EffectOf(name), kWidth, kHeight);
        Prepare(bridged, own);
        const Frame expected = ByModule(own, a, b);
        for (const bool isUpper : {true, false}) {
            Render(bridged, a, b);
            bridged.Connect(clip::kOutput, kBlank, kBounds);
            OfxProps in = bridged.RenderArguments(kTime, kBounds);
            in.Set(prop::kField, {std::string(isUpper ? "OfxFieldUpper" : "OfxFieldLower")});
            EXPECT_EQ(bridged.Act(action::kRender, &in), kStatOk);
            const Frame shown = bridged.Effect().clips[clip::kOutput].image->Pixels();
            for (size_t i = 0; i < shown.size(); ++i) {
                // The top row is y = 53: the upper field has the odd ones.
                const bool isTreated = (i / kWidth % 2 == 0) == isUpper;
                ASSERT_EQ(shown[i], isTreated ? expected[i] : kBlank[i]) << name << " " << i;
            }
        }
    }
}

// Half the scale is the module's frame of half the size, with the same fractions for points.
TEST(OpenFxTest, RenderScaleShrinksThePixelsAlone) {
    constexpr RectI kHalf = {0, 0, kWidth / 2, kHeight / 2};
    const Frame a = RandomFrame(size_t{kWidth} * kHeight / 4, 7), b = RandomFrame(a.size(), 8);
    for (const std::string& name : Names()) {
        COfxInstance bridged(name);
        CTestInstance own(EffectOf(name), kWidth / 2, kHeight / 2);
        Prepare(bridged, own);
        const std::vector<std::string> sources = bridged.Sources();
        bridged.Connect(sources[0], a, kHalf, {}, 0.5);
        bridged.Connect(sources.back(), sources.size() > 1 ? b : a, kHalf, {}, 0.5);
        bridged.Connect(clip::kOutput, a, kHalf, {}, 0.5);
        OfxProps in = bridged.RenderArguments(kTime, kHalf, 0.5);
        EXPECT_EQ(bridged.Act(action::kRender, &in), kStatOk);
        EXPECT_EQ(bridged.Effect().clips[clip::kOutput].image->Pixels(), ByModule(own, a, b))
            << name;
    }
}

// y upwards in the host, downwards in the module; canonical coordinates of an image that does not
// begin at the origin.
TEST(OpenFxTest, PointsAreTurnedUpsideDown) {
    const Frame a = Input(9), b = Input(10);
    const RectI moved = {100, -20, 100 + kWidth, -20 + kHeight};
    const auto render = [&](COfxInstance& instance) {
        for (const std::string& source : instance.Sources()) {
            instance.Connect(source, source == "Picture" ? b : a, moved);
        }
        instance.Connect(clip::kOutput, kBlank, moved);
        OfxProps in = instance.RenderArguments(kTime, moved);
        EXPECT_EQ(instance.Act(action::kRender, &in), kStatOk);
        return instance.Effect().clips[clip::kOutput].image->Pixels();
    };
    COfxInstance ray("light-ray");
    ray.Set("P2", {100 + 0.25 * kWidth, -20 + 0.75 * kHeight}); // a quarter from the top
    CTestInstance ownRay(EffectOf("light-ray"), kWidth, kHeight);
    ownRay.Set("P2", std::array{0.25F, 0.25F});
    EXPECT_EQ(render(ray), ByModule(ownRay, a, b));

    COfxInstance dreamy("dreamy");
    dreamy.Set("P2TopLeft", {100 + 0.125 * kWidth, -20 + 0.75 * kHeight});
    dreamy.Set("P2BottomRight", {100 + 0.5 * kWidth, -20 + 0.25 * kHeight});
    CTestInstance ownDreamy(EffectOf("dreamy"), kWidth, kHeight);
    ownDreamy.Set("P2", std::array{0.125F, 0.25F, 0.5F, 0.75F});
    EXPECT_EQ(render(dreamy), ByModule(ownDreamy, a, b));

    COfxInstance pip("freeform-picture-in-picture");
    const double corners[4][2] = {{0.125, 0.25}, {0.75, 0.125}, {0.875, 0.75}, {0.25, 0.875}};
    CTestInstance ownPip(EffectOf("freeform-picture-in-picture"), kWidth, kHeight);
    for (int i = 0; i < 4; ++i) {
        const std::string x = "P" + std::to_string(2 * i), y = "P" + std::to_string(2 * i + 1);
        pip.Set(x, {100 + corners[i][0] * kWidth, -20 + (1 - corners[i][1]) * kHeight});
        ownPip.Set(x.c_str(), static_cast<float>(corners[i][0]));
        ownPip.Set(y.c_str(), static_cast<float>(corners[i][1]));
    }
    EXPECT_EQ(render(pip), ByModule(ownPip, a, b));
}

// Hosts before 1.2 keep points as fractions of the project.
TEST(OpenFxTest, OldHostsKeepFractions) {
    kyvtest::OfxOptions().knowsCoordinateSystem = false;
    {
        COfxInstance ray("light-ray");
        EXPECT_EQ(ray.Descriptor().params.at("P2").props.String(prop::kDoubleType),
                  value::kTypeNormalisedXyAbsolute);
        ray.Effect().props.Set(prop::kProjectSize, {double{kWidth}, double{kHeight}});
        ray.Effect().props.Set(prop::kProjectOffset, {0.0, 0.0});
        ray.Set("P2", {0.25, 0.75});
        CTestInstance own(EffectOf("light-ray"), kWidth, kHeight);
        own.Set("P2", std::array{0.25F, 0.25F});
        const Frame a = Input(11);
        EXPECT_EQ(Render(ray, a, a), ByModule(own, a, a));
    }
    kyvtest::OfxOptions().knowsCoordinateSystem = true;
    COfxInstance current("light-ray"); // the others of this program go on with canonical points
    EXPECT_EQ(current.Descriptor().params.at("P2").props.String(prop::kDoubleType),
              value::kTypeXyAbsolute);
}

TEST(OpenFxTest, ValuesAreThoseOfTheRenderTime) {
    const Frame a = Input(12), b = Input(13);
    COfxInstance bridged("color-temperature");
    bridged.Effect().params["P1"].animation = [](double time) {
        return std::vector<double>{time / 124}; // 0.5 at 62
    };
    CTestInstance own(EffectOf("color-temperature"), kWidth, kHeight);
    own.Set("P1", 0.5F);
    EXPECT_EQ(Render(bridged, a, b), ByModule(own, a, b));

    // Another seed, other strokes; the same again, the same. Strokes need something to outline.
    Frame squares(a.size());
    for (size_t i = 0; i < squares.size(); ++i) {
        squares[i] = (i / 12 + i / kWidth / 12) % 2 ? 0xFFC0C0C0 : 0xFF404040;
    }
    COfxInstance sketch("pencil-sketch");
    sketch.Set("P8", {1});
    const Frame first = Render(sketch, squares, b);
    sketch.Set("Seed", {17});
    EXPECT_NE(Render(sketch, squares, b), first);
    sketch.Set("Seed", {0});
    EXPECT_EQ(Render(sketch, squares, b), first);
}

TEST(OpenFxTest, TimesCountFromTheClipsFirstFrame) {
    const Frame a = Input(14);
    COfxInstance bridged("fireworks");
    CTestInstance own(EffectOf("fireworks"), kWidth, kHeight);
    const Frame expected = ByModule(own, a, a);
    EXPECT_EQ(Render(bridged, a, a), expected);
    // The same clip, a thousand frames later on the host's time line.
    bridged.Effect().clips[clip::kSource].props.Set(prop::kFrameRange, {1000.0, 1099.0});
    bridged.Connect(clip::kOutput, kBlank, kBounds);
    OfxProps in = bridged.RenderArguments(1000 + kTime, kBounds);
    EXPECT_EQ(bridged.Act(action::kRender, &in), kStatOk);
    EXPECT_EQ(bridged.Effect().clips[clip::kOutput].image->Pixels(), expected);
    // Times that no clip has count as its beginning.
    CTestInstance start(EffectOf("fireworks"), kWidth, kHeight);
    const Frame beginning = ByModule(start, a, a, 0);
    for (const double time : {std::nan(""), -1e300, 1e300, double(INFINITY), -5.0}) {
        EXPECT_EQ(Render(bridged, a, a, {}, time), beginning) << time;
    }
}

TEST(OpenFxTest, NeutralSettingsAreIdentities) {
    const Frame a = Input(15), b = Input(16);
    const auto identity = [&](COfxInstance& instance) {
        Render(instance, a, b); // connects the clips
        OfxProps in = instance.RenderArguments(kTime, kBounds), out;
        return instance.Act(action::kIsIdentity, &in, &out) == kStatOk ? out.String(prop::kName)
                                                                       : "";
    };
    for (const char* name : {"color-temperature", "white-balance"}) {
        COfxInstance instance(name);
        EXPECT_EQ(identity(instance), clip::kSource) << name;
        EXPECT_EQ(Render(instance, a, b), a) << name;
    }
    COfxInstance warm("color-temperature");
    warm.Set("P1", {0.25});
    EXPECT_EQ(identity(warm), "");
    for (const char* name : {"alpha-transition", "test-alpha-transition"}) {
        COfxInstance wipe(name);
        wipe.Set("Transition", {0});
        EXPECT_EQ(identity(wipe), clip::kFrom);
        EXPECT_EQ(Render(wipe, a, b), a);
        wipe.Set("Transition", {1});
        EXPECT_EQ(identity(wipe), clip::kTo);
        EXPECT_EQ(Render(wipe, a, b), b);
        wipe.Set("Transition", {0.5});
        EXPECT_EQ(identity(wipe), "");
    }
    COfxInstance dreamy("dreamy");
    EXPECT_EQ(identity(dreamy), "");
}

TEST(OpenFxTest, UnconnectedClipsGiveAClearResult) {
    const Frame a = Input(17), b = Input(18), nothing(a.size(), 0);
    for (const std::string& name : Names()) {
        SCOPED_TRACE(name);
        COfxInstance bridged(name);
        const std::vector<std::string> sources = bridged.Sources();
        bridged.Connect(clip::kOutput, kBlank, kBounds);
        OfxProps in = bridged.RenderArguments(kTime, kBounds), out;
        EXPECT_EQ(bridged.Act(action::kRender, &in), kStatOk);
        EXPECT_EQ(bridged.Effect().clips[clip::kOutput].image->Pixels(), nothing);
        EXPECT_EQ(bridged.Act(action::kIsIdentity, &in, &out), kStatReplyDefault);
        EXPECT_EQ(bridged.Act(action::kGetRegionOfDefinition, &in, &out), kStatReplyDefault);
        EXPECT_EQ(bridged.Act(action::kGetRegionsOfInterest, &in, &out), kStatReplyDefault);
        if (sources.size() == 1) {
            continue;
        }
        // Without a picture the background is shown; a wipe goes from or to nothing.
        CTestInstance own(EffectOf(name), kWidth, kHeight);
        Prepare(bridged, own);
        bridged.Effect().clips[sources[1]].props.Set(prop::kConnected, {0});
        bridged.Connect(sources[0], a, kBounds);
        EXPECT_EQ(bridged.Act(action::kRender, &in), kStatOk);
        const bool isWipe = EffectOf(name).properties.isTransition != 0;
        EXPECT_EQ(bridged.Effect().clips[clip::kOutput].image->Pixels(),
                  isWipe ? ByModule(own, a, nothing) : a);
    }
}

TEST(OpenFxTest, RegionsAreWholePictures) {
    const Frame a = Input(19), small = RandomFrame(16 * 8, 20);
    COfxInstance wipe("alpha-transition");
    wipe.Connect(clip::kFrom, a, kBounds);
    wipe.Connect(clip::kTo, small, {90, -4, 106, 4});
    OfxProps in = wipe.RenderArguments(kTime, kBounds), out;
    EXPECT_EQ(wipe.Act(action::kGetRegionOfDefinition, &in, &out), kStatOk);
    const double both[4] = {0, -4, 106, kHeight};
    for (size_t i = 0; i < 4; ++i) {
        EXPECT_EQ(out.Double(prop::kRegionOfDefinition, i), both[i]);
    }
    EXPECT_EQ(wipe.Act(action::kGetRegionsOfInterest, &in, &out), kStatOk);
    EXPECT_EQ(out.Double("OfxImageClipPropRoI_SourceTo", 0), 90);
    EXPECT_EQ(out.Double("OfxImageClipPropRoI_SourceFrom", 3), kHeight);

    // The picture in a picture fills its quad whatever its size and place.
    COfxInstance pip("freeform-picture-in-picture");
    CTestInstance own(EffectOf("freeform-picture-in-picture"), kWidth, kHeight);
    Prepare(pip, own);
    pip.Connect(clip::kSource, a, kBounds);
    pip.Connect("Picture", Frame(16 * 8, 0xFF4080C0), {500, 500, 516, 508});
    pip.Connect(clip::kOutput, kBlank, kBounds);
    EXPECT_EQ(pip.Act(action::kGetRegionOfDefinition, &in, &out), kStatOk);
    EXPECT_EQ(out.Double(prop::kRegionOfDefinition, 2), kWidth);
    EXPECT_EQ(pip.Act(action::kRender, &in), kStatOk);
    EXPECT_EQ(pip.Effect().clips[clip::kOutput].image->Pixels(),
              ByModule(own, a, Frame(a.size(), 0xFF4080C0)));
}

// A picture that is no possible frame counts as none: its pixels are fewer than the frame's here,
// and are told to be many more.
TEST(OpenFxTest, ImpossiblePicturesAreLeftOut) {
    const Frame a = RandomFrame(300 * 300, 31);
    constexpr RectI kFrame = {0, 0, 300, 300};
    const std::pair<Frame, RectI> pictures[] = {
        {Frame(70000, 0xFF4080C0), {0, 0, 70000, 1}},
        {Frame(8 * 8, 0xFF4080C0), {0, 0, 8, 8}},
    };
    for (const auto& [picture, bounds] : pictures) {
        COfxInstance pip("freeform-picture-in-picture");
        pip.Connect(clip::kSource, a, kFrame);
        pip.Connect("Picture", picture, bounds);
        if (bounds.x2 == 8) {
            pip.Effect().clips["Picture"].image->props.Set(prop::kImageRegion,
                                                           {0, 0, 1 << 30, 1 << 30});
        }
        pip.Connect(clip::kOutput, Frame(a.size(), 0x11223344), kFrame);
        OfxProps in = pip.RenderArguments(kTime, kFrame);
        EXPECT_EQ(pip.Act(action::kRender, &in), kStatOk);
        EXPECT_EQ(pip.Effect().clips[clip::kOutput].image->Pixels(), a);
    }
}

// Images that no effect can work on are refused; nothing is touched.
TEST(OpenFxTest, BrokenImagesAreRefused) {
    const Frame a = Input(21), b = Input(22);
    const std::pair<const char*, OfxProps::Value> faults[] = {
        {prop::kData, static_cast<void*>(nullptr)},
        {prop::kRowBytes, kWidth * 4 - 1},
        {prop::kRowBytes, -7},
        {prop::kComponents, std::string("OfxImageComponentAlpha")},
        {prop::kDepth, std::string("OfxBitDepthHalf")},
    };
    COfxInstance bridged("dreamy");
    for (const auto& [name, fault] : faults) {
        Render(bridged, a, b);
        bridged.Connect(clip::kOutput, kBlank, kBounds);
        auto& output = *bridged.Effect().clips[clip::kOutput].image;
        output.props.Set(name, {fault});
        OfxProps in = bridged.RenderArguments(kTime, kBounds);
        EXPECT_EQ(bridged.Act(action::kRender, &in), kStatErrImageFormat) << name;
        EXPECT_EQ(output.Pixels(), kBlank);
        // As a source it counts as nothing.
        bridged.Connect(clip::kOutput, kBlank, kBounds);
        bridged.Effect().clips[clip::kSource].image->props.Set(name, {fault});
        EXPECT_EQ(bridged.Act(action::kRender, &in), kStatOk);
        EXPECT_EQ(bridged.Effect().clips[clip::kOutput].image->Pixels(), Frame(a.size(), 0));
    }
    bridged.Effect().clips[clip::kOutput].image->props.Set(prop::kImageRegion,
                                                           {0, 0, 1 << 30, 1 << 30});
    OfxProps in = bridged.RenderArguments(kTime, kBounds);
    EXPECT_EQ(bridged.Act(action::kRender, &in), kStatErrUnsupported);
    bridged.Effect().clips[clip::kOutput].image.reset();
    EXPECT_EQ(bridged.Act(action::kRender, &in), kStatFailed);
}

TEST(OpenFxTest, HostileValuesDoNoHarm) {
    const Frame a = Input(23), b = Input(24);
    const double numbers[] = {std::nan(""), INFINITY, -INFINITY, 1e300, -1e300, 1e9, -1e9};
    for (const std::string& name : Names()) {
        COfxInstance bridged(name);
        for (const double number : numbers) {
            for (auto& [key, param] : bridged.Effect().params) {
                const bool isReal = param.type == paramtype::kDouble ||
                                    param.type == paramtype::kRgb ||
                                    param.type == paramtype::kDouble2D;
                for (double& value : param.values) {
                    value = isReal                  ? number
                            : std::isfinite(number) ? std::clamp(number, -2e9, 2e9)
                                                    : 7;
                }
            }
            EXPECT_NE(Render(bridged, a, b), kBlank) << name << number;
        }
        // Arguments that are missing.
        EXPECT_NE(bridged.Act(action::kIsIdentity), kStatFailed);
        EXPECT_EQ(bridged.Act(action::kRender), kStatOk);
        EXPECT_EQ(bridged.Act("OfxActionOfTheFuture"), kStatReplyDefault);
        EXPECT_EQ(bridged.Act(nullptr), kStatErrValue);
        OfxProps odd = bridged.RenderArguments(kTime, {50, 20, 40, 10}, 0); // empty, scale 0
        EXPECT_EQ(bridged.Act(action::kRender, &odd), kStatOk);
    }
    // A host that cannot read its own parameters shows the defaults.
    COfxInstance ray("dreamy");
    CTestInstance own(EffectOf("dreamy"), kWidth, kHeight);
    kyvtest::OfxOptions().failsReadingParams = true;
    EXPECT_EQ(Render(ray, a, b), ByModule(own, a, b));
    kyvtest::OfxOptions().failsReadingParams = false;
}

TEST(OpenFxTest, LivesOfAllKinds) {
    const Frame a = Input(25), b = Input(26);
    for (Plugin* const plugin : OfxPlugins()) {
        plugin->setHost(nullptr);
        plugin->setHost(kyvtest::OfxTestHost()); // once more
        OfxEffect none;
        EXPECT_EQ(plugin->mainEntry(action::kRender, none.Handle(), nullptr, nullptr),
                  kStatErrBadHandle);
        EXPECT_EQ(plugin->mainEntry(action::kDestroyInstance, none.Handle(), nullptr, nullptr),
                  kStatOk);
        EXPECT_EQ(plugin->mainEntry(action::kLoad, nullptr, nullptr, nullptr), kStatOk);
    }
    for (const std::string& name : Names()) {
        { const COfxInstance neverRendered(name); }
        COfxInstance bridged(name);
        const Frame first = Render(bridged, a, b);
        EXPECT_EQ(bridged.Act(action::kPurgeCaches), kStatOk);
        EXPECT_EQ(Render(bridged, a, b), first) << name;
        EXPECT_EQ(bridged.Act(action::kEndSequence), kStatOk);
        EXPECT_EQ(Render(bridged, a, b), first) << name;
        // A host that asks to stop gets no pixels, at whichever question.
        for (const int questions : {0, 1, 2}) {
            bridged.Effect().abortAfter = questions;
            EXPECT_EQ(Render(bridged, a, b), kBlank) << name << questions;
        }
        bridged.Effect().abortAfter = -1;
        EXPECT_EQ(Render(bridged, a, b), first);
        OfxProps out;
        EXPECT_EQ(bridged.Act(action::kGetClipPreferences, nullptr, &out), kStatOk);
        EXPECT_EQ(out.Int(prop::kFrameVarying),
                  EffectOf(name).properties.familyVariant == EffectFamilyVariant_Particle ||
                      name == "pencil-sketch");
    }
    // The optional suites may be missing.
    kyvtest::OfxOptions().hasMessages = kyvtest::OfxOptions().hasInteract = false;
    {
        COfxInstance pip("freeform-picture-in-picture");
        EXPECT_EQ(pip.Descriptor().props.Count(prop::kOverlayV2), 0U);
        Render(pip, a, b);
    }
    kyvtest::OfxOptions().hasMessages = kyvtest::OfxOptions().hasInteract = true;
    const COfxInstance again("freeform-picture-in-picture");
    EXPECT_EQ(again.Descriptor().props.Count(prop::kOverlayV2), 1U);
}

// One instance from several threads, and all effects beside each other.
TEST(OpenFxTest, SeveralRendersAtOnce) {
    const Frame a = Input(27), b = Input(28);
    std::vector<std::unique_ptr<COfxInstance>> instances;
    std::vector<Frame> expected;
    std::vector<OfxProps> arguments;
    for (const std::string& name : Names()) {
        instances.push_back(std::make_unique<COfxInstance>(name));
        expected.push_back(Render(*instances.back(), a, b));
    }
    std::vector<std::thread> threads;
    for (const auto& instance : instances) {
        for (int i = 0; i < 2; ++i) {
            threads.emplace_back([&instance] {
                OfxProps in = instance->RenderArguments(kTime, kBounds);
                for (int round = 0; round < 3; ++round) {
                    EXPECT_EQ(instance->Act(action::kRender, &in), kStatOk);
                }
            });
        }
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    for (size_t i = 0; i < instances.size(); ++i) {
        EXPECT_EQ(instances[i]->Effect().clips[clip::kOutput].image->Pixels(), expected[i]);
    }
}

TEST(OpenFxTest, CornersAreDragged) {
    COfxInstance pip("freeform-picture-in-picture");
    auto* const entry =
        reinterpret_cast<EntryPoint*>(pip.Descriptor().props.Pointer(prop::kOverlayV2));
    ASSERT_NE(entry, nullptr);
    pip.Set("P0", {10, 40});
    pip.Set("P2", {80, 40});
    pip.Set("P4", {80, 10});
    pip.Set("P6", {10, 10});
    kyvtest::OfxInteract interact;
    const auto act = [&](const char* action, double x, double y) {
        OfxProps in;
        in.Set(prop::kEffectInstance, {static_cast<void*>(pip.Effect().Handle())});
        in.Set(prop::kTime, {kTime});
        in.Set(prop::kPixelScale, {0.5, 0.5});
        in.Set(prop::kPenPosition, {x, y});
        in.Set(prop::kDrawContext, {static_cast<void*>(&interact)});
        return entry(action, &interact, in.Handle(), nullptr);
    };
    EXPECT_EQ(act(action::kDescribe, 0, 0), kStatOk);
    EXPECT_EQ(act(action::kCreateInstance, 0, 0), kStatOk);
    EXPECT_EQ(act(action::kInteractDraw, 0, 0), kStatOk);
    ASSERT_EQ(kyvtest::OfxDrawn().size(), 5U); // the quad and its corners
    EXPECT_EQ(kyvtest::OfxDrawn()[0][2].x, 80);
    EXPECT_EQ(kyvtest::OfxDrawn()[0][2].y, 10);
    EXPECT_EQ(act(action::kInteractPenMotion, 50, 50), kStatReplyDefault); // nothing is held
    // Eight pixels of the screen are 4 units here.
    EXPECT_EQ(act(action::kInteractPenDown, 75, 40), kStatReplyDefault);
    EXPECT_EQ(act(action::kInteractPenDown, 77, 41), kStatOk);
    EXPECT_EQ(act(action::kInteractPenMotion, 70, 30), kStatOk);
    EXPECT_EQ(act(action::kInteractPenMotion, std::nan(""), 30), kStatOk);
    EXPECT_EQ(act(action::kInteractPenUp, 60, 35), kStatOk);
    EXPECT_EQ(act(action::kInteractPenMotion, 0, 0), kStatReplyDefault);
    EXPECT_THAT(pip.Effect().params["P2"].values, testing::ElementsAre(60, 35));
    EXPECT_THAT(pip.Effect().params["P0"].values, testing::ElementsAre(10, 40));
    EXPECT_EQ(interact.redraws, 3);
    // A host with handles of its own drags by itself.
    pip.Effect().params["P0"].props.Set(prop::kHasHostHandle, {1});
    EXPECT_EQ(act(action::kInteractPenDown, 10, 40), kStatReplyDefault);
}

} // namespace

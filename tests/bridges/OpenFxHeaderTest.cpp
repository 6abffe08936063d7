// Our declarations of the OpenFX interface against the public headers, where they are at hand.
#include <gtest/gtest.h>

#if KYV_HAS_OPENFX_HEADERS

#include <cstddef>

#include <ofxCore.h>
#include <ofxDrawSuite.h>
#include <ofxImageEffect.h>
#include <ofxOld.h>

#include "bridges/openfx/OpenFx.h"

namespace {

using namespace kyvofx;

TEST(OpenFxHeaderTest, NamesAreThePublicOnes) {
    const struct {
        const char *ours, *theirs;
    } names[] = {
        {suite::kProperty, kOfxPropertySuite},
        {suite::kParameter, kOfxParameterSuite},
        {suite::kImageEffect, kOfxImageEffectSuite},
        {suite::kMessage, kOfxMessageSuite},
        {suite::kInteract, kOfxInteractSuite},
        {suite::kDraw, kOfxDrawSuite},
        {kImageEffectApi, kOfxImageEffectPluginApi},
        {action::kLoad, kOfxActionLoad},
        {action::kUnload, kOfxActionUnload},
        {action::kDescribe, kOfxActionDescribe},
        {action::kDescribeInContext, kOfxImageEffectActionDescribeInContext},
        {action::kCreateInstance, kOfxActionCreateInstance},
        {action::kDestroyInstance, kOfxActionDestroyInstance},
        {action::kPurgeCaches, kOfxActionPurgeCaches},
        {action::kRender, kOfxImageEffectActionRender},
        {action::kIsIdentity, kOfxImageEffectActionIsIdentity},
        {action::kBeginSequence, kOfxImageEffectActionBeginSequenceRender},
        {action::kEndSequence, kOfxImageEffectActionEndSequenceRender},
        {action::kGetRegionOfDefinition, kOfxImageEffectActionGetRegionOfDefinition},
        {action::kGetRegionsOfInterest, kOfxImageEffectActionGetRegionsOfInterest},
        {action::kGetClipPreferences, kOfxImageEffectActionGetClipPreferences},
        {action::kInteractDraw, kOfxInteractActionDraw},
        {action::kInteractPenDown, kOfxInteractActionPenDown},
        {action::kInteractPenMotion, kOfxInteractActionPenMotion},
        {action::kInteractPenUp, kOfxInteractActionPenUp},
        {context::kFilter, kOfxImageEffectContextFilter},
        {context::kGeneral, kOfxImageEffectContextGeneral},
        {context::kTransition, kOfxImageEffectContextTransition},
        {clip::kOutput, kOfxImageEffectOutputClipName},
        {clip::kSource, kOfxImageEffectSimpleSourceClipName},
        {clip::kFrom, kOfxImageEffectTransitionSourceFromClipName},
        {clip::kTo, kOfxImageEffectTransitionSourceToClipName},
        {value::kRgba, kOfxImageComponentRGBA},
        {value::kByte, kOfxBitDepthByte},
        {value::kShort, kOfxBitDepthShort},
        {value::kFloat, kOfxBitDepthFloat},
        {value::kInstanceSafe, kOfxImageEffectRenderInstanceSafe},
        {value::kPremultiplied, kOfxImagePreMultiplied},
        {value::kFieldLower, kOfxImageFieldLower},
        {value::kFieldUpper, kOfxImageFieldUpper},
        {value::kFieldBoth, kOfxImageFieldBoth},
        {value::kMessageError, kOfxMessageError},
        {value::kCoordinatesNormalised, kOfxParamCoordinatesNormalised},
        {value::kTypeXyAbsolute, kOfxParamDoubleTypeXYAbsolute},
        {value::kTypeNormalisedXyAbsolute, kOfxParamDoubleTypeNormalisedXYAbsolute},
        {paramtype::kInteger, kOfxParamTypeInteger},
        {paramtype::kDouble, kOfxParamTypeDouble},
        {paramtype::kBoolean, kOfxParamTypeBoolean},
        {paramtype::kChoice, kOfxParamTypeChoice},
        {paramtype::kRgb, kOfxParamTypeRGB},
        {paramtype::kDouble2D, kOfxParamTypeDouble2D},
        {paramtype::kGroup, kOfxParamTypeGroup},
        {paramtype::kPage, kOfxParamTypePage},
        {prop::kName, kOfxPropName},
        {prop::kLabel, kOfxPropLabel},
        {prop::kShortLabel, kOfxPropShortLabel},
        {prop::kLongLabel, kOfxPropLongLabel},
        {prop::kDescription, kOfxPropPluginDescription},
        {prop::kTime, kOfxPropTime},
        {prop::kInstanceData, kOfxPropInstanceData},
        {prop::kEffectInstance, kOfxPropEffectInstance},
        {prop::kContext, kOfxImageEffectPropContext},
        {prop::kSupportedContexts, kOfxImageEffectPropSupportedContexts},
        {prop::kSupportedDepths, kOfxImageEffectPropSupportedPixelDepths},
        {prop::kSupportedComponents, kOfxImageEffectPropSupportedComponents},
        {prop::kGrouping, kOfxImageEffectPluginPropGrouping},
        {prop::kThreadSafety, kOfxImageEffectPluginRenderThreadSafety},
        {prop::kHostFrameThreading, kOfxImageEffectPluginPropHostFrameThreading},
        {prop::kSupportsTiles, kOfxImageEffectPropSupportsTiles},
        {prop::kSupportsMultiResolution, kOfxImageEffectPropSupportsMultiResolution},
        {prop::kTemporalClipAccess, kOfxImageEffectPropTemporalClipAccess},
        {prop::kFieldRenderTwice, kOfxImageEffectPluginPropFieldRenderTwiceAlways},
        {prop::kFieldExtraction, kOfxImageClipPropFieldExtraction},
        {prop::kOverlayV2, kOfxImageEffectPluginPropOverlayInteractV2},
        {prop::kDepth, kOfxImageEffectPropPixelDepth},
        {prop::kComponents, kOfxImageEffectPropComponents},
        {prop::kPremultiplication, kOfxImageEffectPropPreMultiplication},
        {prop::kPixelAspect, kOfxImagePropPixelAspectRatio},
        {prop::kData, kOfxImagePropData},
        {prop::kBounds, kOfxImagePropBounds},
        {prop::kImageRegion, kOfxImagePropRegionOfDefinition},
        {prop::kRowBytes, kOfxImagePropRowBytes},
        {prop::kRenderWindow, kOfxImageEffectPropRenderWindow},
        {prop::kRenderScale, kOfxImageEffectPropRenderScale},
        {prop::kField, kOfxImageEffectPropFieldToRender},
        {prop::kRegionOfDefinition, kOfxImageEffectPropRegionOfDefinition},
        {prop::kConnected, kOfxImageClipPropConnected},
        {prop::kFrameRate, kOfxImageEffectPropFrameRate},
        {prop::kFrameRange, kOfxImageEffectPropFrameRange},
        {prop::kEffectDuration, kOfxImageEffectInstancePropEffectDuration},
        {prop::kProjectSize, kOfxImageEffectPropProjectSize},
        {prop::kProjectOffset, kOfxImageEffectPropProjectOffset},
        {prop::kFrameVarying, kOfxImageEffectFrameVarying},
        {prop::kDefault, kOfxParamPropDefault},
        {prop::kMin, kOfxParamPropMin},
        {prop::kMax, kOfxParamPropMax},
        {prop::kDisplayMin, kOfxParamPropDisplayMin},
        {prop::kDisplayMax, kOfxParamPropDisplayMax},
        {prop::kHint, kOfxParamPropHint},
        {prop::kChoiceOption, kOfxParamPropChoiceOption},
        {prop::kAnimates, kOfxParamPropAnimates},
        {prop::kParent, kOfxParamPropParent},
        {prop::kPageChild, kOfxParamPropPageChild},
        {prop::kDoubleType, kOfxParamPropDoubleType},
        {prop::kCoordinateSystem, kOfxParamPropDefaultCoordinateSystem},
        {prop::kUseHostHandle, kOfxParamPropUseHostOverlayHandle},
        {prop::kHasHostHandle, kOfxParamPropHasHostOverlayHandle},
        {prop::kPenPosition, kOfxInteractPropPenPosition},
        {prop::kPixelScale, kOfxInteractPropPixelScale},
        {prop::kDrawContext, kOfxInteractPropDrawContext},
        {kTransitionParam, kOfxImageEffectTransitionParamName},
    };
    for (const auto& [ours, theirs] : names) {
        EXPECT_STREQ(ours, theirs);
    }
    EXPECT_EQ(int{kStatOk}, kOfxStatOK);
    EXPECT_EQ(int{kStatFailed}, kOfxStatFailed);
    EXPECT_EQ(int{kStatErrMissingHostFeature}, kOfxStatErrMissingHostFeature);
    EXPECT_EQ(int{kStatErrUnsupported}, kOfxStatErrUnsupported);
    EXPECT_EQ(int{kStatErrMemory}, kOfxStatErrMemory);
    EXPECT_EQ(int{kStatErrBadHandle}, kOfxStatErrBadHandle);
    EXPECT_EQ(int{kStatErrBadIndex}, kOfxStatErrBadIndex);
    EXPECT_EQ(int{kStatErrValue}, kOfxStatErrValue);
    EXPECT_EQ(int{kStatReplyDefault}, kOfxStatReplyDefault);
    EXPECT_EQ(int{kStatErrImageFormat}, kOfxStatErrImageFormat);
    EXPECT_EQ(int{kDrawPrimitive_LineLoop}, kOfxDrawPrimitiveLineLoop);
    EXPECT_EQ(int{kDrawPrimitive_Rectangle}, kOfxDrawPrimitiveRectangle);
}

// Same place and size of every slot; the types differ by the names of handles.
TEST(OpenFxHeaderTest, SlotsAreThePublicOnes) {
#define EXPECT_SLOT(ours, slot, theirs, theirSlot)                                                 \
    EXPECT_EQ(offsetof(ours, slot), offsetof(theirs, theirSlot));                                  \
    EXPECT_EQ(sizeof(ours::slot), sizeof(theirs::theirSlot))
    EXPECT_EQ(sizeof(kyvofx::Host), sizeof(::OfxHost));
    EXPECT_SLOT(kyvofx::Host, host, ::OfxHost, host);
    EXPECT_SLOT(kyvofx::Host, fetchSuite, ::OfxHost, fetchSuite);
    EXPECT_EQ(sizeof(kyvofx::Plugin), sizeof(::OfxPlugin));
    EXPECT_SLOT(kyvofx::Plugin, api, ::OfxPlugin, pluginApi);
    EXPECT_SLOT(kyvofx::Plugin, apiVersion, ::OfxPlugin, apiVersion);
    EXPECT_SLOT(kyvofx::Plugin, identifier, ::OfxPlugin, pluginIdentifier);
    EXPECT_SLOT(kyvofx::Plugin, versionMajor, ::OfxPlugin, pluginVersionMajor);
    EXPECT_SLOT(kyvofx::Plugin, versionMinor, ::OfxPlugin, pluginVersionMinor);
    EXPECT_SLOT(kyvofx::Plugin, setHost, ::OfxPlugin, setHost);
    EXPECT_SLOT(kyvofx::Plugin, mainEntry, ::OfxPlugin, mainEntry);
    EXPECT_EQ(sizeof(kyvofx::PropertySuite), sizeof(OfxPropertySuiteV1));
    EXPECT_SLOT(kyvofx::PropertySuite, setPointer, OfxPropertySuiteV1, propSetPointer);
    EXPECT_SLOT(kyvofx::PropertySuite, setString, OfxPropertySuiteV1, propSetString);
    EXPECT_SLOT(kyvofx::PropertySuite, setDouble, OfxPropertySuiteV1, propSetDouble);
    EXPECT_SLOT(kyvofx::PropertySuite, setInt, OfxPropertySuiteV1, propSetInt);
    EXPECT_SLOT(kyvofx::PropertySuite, setPointerN, OfxPropertySuiteV1, propSetPointerN);
    EXPECT_SLOT(kyvofx::PropertySuite, setStringN, OfxPropertySuiteV1, propSetStringN);
    EXPECT_SLOT(kyvofx::PropertySuite, setDoubleN, OfxPropertySuiteV1, propSetDoubleN);
    EXPECT_SLOT(kyvofx::PropertySuite, setIntN, OfxPropertySuiteV1, propSetIntN);
    EXPECT_SLOT(kyvofx::PropertySuite, getPointer, OfxPropertySuiteV1, propGetPointer);
    EXPECT_SLOT(kyvofx::PropertySuite, getString, OfxPropertySuiteV1, propGetString);
    EXPECT_SLOT(kyvofx::PropertySuite, getDouble, OfxPropertySuiteV1, propGetDouble);
    EXPECT_SLOT(kyvofx::PropertySuite, getInt, OfxPropertySuiteV1, propGetInt);
    EXPECT_SLOT(kyvofx::PropertySuite, getPointerN, OfxPropertySuiteV1, propGetPointerN);
    EXPECT_SLOT(kyvofx::PropertySuite, getStringN, OfxPropertySuiteV1, propGetStringN);
    EXPECT_SLOT(kyvofx::PropertySuite, getDoubleN, OfxPropertySuiteV1, propGetDoubleN);
    EXPECT_SLOT(kyvofx::PropertySuite, getIntN, OfxPropertySuiteV1, propGetIntN);
    EXPECT_SLOT(kyvofx::PropertySuite, reset, OfxPropertySuiteV1, propReset);
    EXPECT_SLOT(kyvofx::PropertySuite, getDimension, OfxPropertySuiteV1, propGetDimension);
    EXPECT_EQ(sizeof(kyvofx::ParameterSuite), sizeof(OfxParameterSuiteV1));
    EXPECT_SLOT(kyvofx::ParameterSuite, define, OfxParameterSuiteV1, paramDefine);
    EXPECT_SLOT(kyvofx::ParameterSuite, getHandle, OfxParameterSuiteV1, paramGetHandle);
    EXPECT_SLOT(kyvofx::ParameterSuite, setGetPropertySet, OfxParameterSuiteV1,
                paramSetGetPropertySet);
    EXPECT_SLOT(kyvofx::ParameterSuite, getPropertySet, OfxParameterSuiteV1, paramGetPropertySet);
    EXPECT_SLOT(kyvofx::ParameterSuite, getValue, OfxParameterSuiteV1, paramGetValue);
    EXPECT_SLOT(kyvofx::ParameterSuite, getValueAtTime, OfxParameterSuiteV1, paramGetValueAtTime);
    EXPECT_SLOT(kyvofx::ParameterSuite, getDerivative, OfxParameterSuiteV1, paramGetDerivative);
    EXPECT_SLOT(kyvofx::ParameterSuite, getIntegral, OfxParameterSuiteV1, paramGetIntegral);
    EXPECT_SLOT(kyvofx::ParameterSuite, setValue, OfxParameterSuiteV1, paramSetValue);
    EXPECT_SLOT(kyvofx::ParameterSuite, setValueAtTime, OfxParameterSuiteV1, paramSetValueAtTime);
    EXPECT_SLOT(kyvofx::ParameterSuite, getNumKeys, OfxParameterSuiteV1, paramGetNumKeys);
    EXPECT_SLOT(kyvofx::ParameterSuite, getKeyTime, OfxParameterSuiteV1, paramGetKeyTime);
    EXPECT_SLOT(kyvofx::ParameterSuite, getKeyIndex, OfxParameterSuiteV1, paramGetKeyIndex);
    EXPECT_SLOT(kyvofx::ParameterSuite, deleteKey, OfxParameterSuiteV1, paramDeleteKey);
    EXPECT_SLOT(kyvofx::ParameterSuite, deleteAllKeys, OfxParameterSuiteV1, paramDeleteAllKeys);
    EXPECT_SLOT(kyvofx::ParameterSuite, copy, OfxParameterSuiteV1, paramCopy);
    EXPECT_SLOT(kyvofx::ParameterSuite, editBegin, OfxParameterSuiteV1, paramEditBegin);
    EXPECT_SLOT(kyvofx::ParameterSuite, editEnd, OfxParameterSuiteV1, paramEditEnd);
    EXPECT_EQ(sizeof(kyvofx::ImageEffectSuite), sizeof(OfxImageEffectSuiteV1));
    EXPECT_SLOT(kyvofx::ImageEffectSuite, getPropertySet, OfxImageEffectSuiteV1, getPropertySet);
    EXPECT_SLOT(kyvofx::ImageEffectSuite, getParamSet, OfxImageEffectSuiteV1, getParamSet);
    EXPECT_SLOT(kyvofx::ImageEffectSuite, clipDefine, OfxImageEffectSuiteV1, clipDefine);
    EXPECT_SLOT(kyvofx::ImageEffectSuite, clipGetHandle, OfxImageEffectSuiteV1, clipGetHandle);
    EXPECT_SLOT(kyvofx::ImageEffectSuite, clipGetPropertySet, OfxImageEffectSuiteV1,
                clipGetPropertySet);
    EXPECT_SLOT(kyvofx::ImageEffectSuite, clipGetImage, OfxImageEffectSuiteV1, clipGetImage);
    EXPECT_SLOT(kyvofx::ImageEffectSuite, clipReleaseImage, OfxImageEffectSuiteV1,
                clipReleaseImage);
    EXPECT_SLOT(kyvofx::ImageEffectSuite, clipGetRegionOfDefinition, OfxImageEffectSuiteV1,
                clipGetRegionOfDefinition);
    EXPECT_SLOT(kyvofx::ImageEffectSuite, abort, OfxImageEffectSuiteV1, abort);
    EXPECT_SLOT(kyvofx::ImageEffectSuite, imageMemoryAlloc, OfxImageEffectSuiteV1,
                imageMemoryAlloc);
    EXPECT_SLOT(kyvofx::ImageEffectSuite, imageMemoryFree, OfxImageEffectSuiteV1, imageMemoryFree);
    EXPECT_SLOT(kyvofx::ImageEffectSuite, imageMemoryLock, OfxImageEffectSuiteV1, imageMemoryLock);
    EXPECT_SLOT(kyvofx::ImageEffectSuite, imageMemoryUnlock, OfxImageEffectSuiteV1,
                imageMemoryUnlock);
    EXPECT_EQ(sizeof(kyvofx::MessageSuite), sizeof(OfxMessageSuiteV1));
    EXPECT_SLOT(kyvofx::MessageSuite, message, OfxMessageSuiteV1, message);
    EXPECT_EQ(sizeof(kyvofx::InteractSuite), sizeof(OfxInteractSuiteV1));
    EXPECT_SLOT(kyvofx::InteractSuite, swapBuffers, OfxInteractSuiteV1, interactSwapBuffers);
    EXPECT_SLOT(kyvofx::InteractSuite, redraw, OfxInteractSuiteV1, interactRedraw);
    EXPECT_SLOT(kyvofx::InteractSuite, getPropertySet, OfxInteractSuiteV1, interactGetPropertySet);
    EXPECT_EQ(sizeof(kyvofx::DrawSuite), sizeof(OfxDrawSuiteV1));
    EXPECT_SLOT(kyvofx::DrawSuite, getColor, OfxDrawSuiteV1, getColour);
    EXPECT_SLOT(kyvofx::DrawSuite, setColor, OfxDrawSuiteV1, setColour);
    EXPECT_SLOT(kyvofx::DrawSuite, setLineWidth, OfxDrawSuiteV1, setLineWidth);
    EXPECT_SLOT(kyvofx::DrawSuite, setLineStipple, OfxDrawSuiteV1, setLineStipple);
    EXPECT_SLOT(kyvofx::DrawSuite, draw, OfxDrawSuiteV1, draw);
    EXPECT_SLOT(kyvofx::DrawSuite, drawText, OfxDrawSuiteV1, drawText);
#undef EXPECT_SLOT
    EXPECT_EQ(sizeof(kyvofx::RectI), sizeof(OfxRectI));
    EXPECT_EQ(sizeof(kyvofx::RectD), sizeof(OfxRectD));
    EXPECT_EQ(sizeof(kyvofx::PointD), sizeof(OfxPointD));
    EXPECT_EQ(sizeof(kyvofx::ColorF), sizeof(OfxRGBAColourF));
}

} // namespace

#else

TEST(OpenFxHeaderTest, NamesAreThePublicOnes) {
    GTEST_SKIP() << "the OpenFX headers are not at hand: name their folder with "
                    "cmake -DKYV_OPENFX_INCLUDE=FOLDER";
}

#endif

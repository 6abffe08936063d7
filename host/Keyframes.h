// Values that are given for moments of a clip.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "host/Easing.h"

namespace kyvhost {

// When a keyframe is: a time after the first frame, or a part of the way to the last one.
struct KeyTime {
    double amount = 0;    // seconds, or 0..100
    bool isShare = false; // percent of the clip
};

// "50%", or a time such as "2.5s". Throws CUsageError; what names the option.
KeyTime ParseKeyTime(std::string_view what, std::string_view text);

// The way back: "50%", "2.5s".
std::string KeyTimeText(const KeyTime& time);

// The value is text as the user writes it. The easing leads to the next keyframe.
struct Keyframe {
    KeyTime time;
    std::string value;
    Easing easing = Easing::Linear;
};

// The frames of a clip as keyframes see them: numbers from 0 to last, perSecond of them a second.
// Frames may lie between whole numbers.
struct FrameScale {
    double last = 0;
    double perSecond = 1;

    double At(const KeyTime& time) const {
        return time.isShare ? time.amount / 100 * last : time.amount * perSecond;
    }
};

} // namespace kyvhost

// Times of keyframes.
#include "host/Keyframes.h"

#include <charconv>

#include "host/Arguments.h"
#include "host/ExitStatus.h"
#include "hosting/Text.h"

namespace kyvhost {

KeyTime ParseKeyTime(std::string_view what, std::string_view text) {
    if (!text.ends_with('%')) {
        return {ParseTime(what, text), false};
    }
    double percent = -1;
    const char* const end = text.data() + text.size() - 1;
    const auto [stop, error] = std::from_chars(text.data(), end, percent);
    if (error != std::errc() || stop != end || !(percent >= 0 && percent <= 100)) {
        throw CUsageError(std::string(what) + ": " + Quoted(text) +
                          " is not a part of the clip, 0% to 100%");
    }
    return {percent, true};
}

std::string KeyTimeText(const KeyTime& time) {
    char text[64];
    char* const end = std::to_chars(text, text + sizeof text, time.amount).ptr;
    return std::string(text, end) + (time.isShare ? "%" : "s");
}

} // namespace kyvhost

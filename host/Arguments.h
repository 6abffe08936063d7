// Numbers, times and ratios on the command line. All throw CUsageError; what names the option.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "host/Rational.h"

namespace kyvhost {

struct Size {
    uint32_t width;
    uint32_t height;
};

// "5", "2.5s", "500ms", "1:30", "1:02:03.5": seconds, never negative.
double ParseTime(std::string_view what, std::string_view text);

// "30", "29.97", "30000/1001": above 0, at most 1000.
Rational ParseRate(std::string_view what, std::string_view text);

// "16:9"
Size ParseAspect(std::string_view what, std::string_view text);

// Words with spaces between; quotes of either kind keep spaces in a word.
std::vector<std::string> SplitWords(std::string_view what, std::string_view text);

// "1920x1080"
Size ParseSize(std::string_view what, std::string_view text);

} // namespace kyvhost

// Numbers, times and ratios on the command line. All throw CUsageError; what names the option.
#pragma once

#include <charconv>
#include <cstdint>
#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

#include "host/Rational.h"
#include "hosting/Error.h"
#include "hosting/Text.h"

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

// One of a few words; the value is the place in the list.
size_t ParseWord(std::string_view what, std::string_view text,
                 const std::vector<std::string>& words);

// Any text but none.
std::filesystem::path ParsePath(std::string_view what, std::string_view text);

// A whole number from least to most.
template <class T>
T ParseWhole(std::string_view what, std::string_view text, T least, T most) {
    using kyvhosting::CUsageError;
    T number = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    const std::string range = std::to_string(least) + " to " + std::to_string(most);
    if (!kyvhosting::IsWholeNumber(text)) {
        throw CUsageError(std::string(what) + ": " + kyvhosting::Quoted(text) +
                          " is not a whole number, " + range);
    }
    if (error != std::errc() || stop != end || number < least || number > most) {
        throw CUsageError(std::string(what) + ": " + std::string(text) +
                          " is out of range: " + range);
    }
    return number;
}

} // namespace kyvhost

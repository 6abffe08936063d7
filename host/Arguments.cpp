// Numbers, times and ratios on the command line.
#include "host/Arguments.h"

#include <charconv>
#include <cmath>
#include <numeric>
#include <optional>

#include "host/ExitStatus.h"
#include "hosting/Text.h"

namespace kyvhost {
namespace {

template <class T>
std::optional<T> Number(std::string_view text) {
    T number = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    return error == std::errc() && stop == end ? std::optional(number) : std::nullopt;
}

[[noreturn]] void Refuse(std::string_view what, std::string_view text, std::string_view wanted) {
    throw CUsageError(std::string(what) + ": " + Quoted(text) + " is not " + std::string(wanted));
}

// Two whole numbers from 1 to most with a separator between.
Size ParsePair(std::string_view what, std::string_view text, char separator, uint32_t most,
               std::string_view wanted) {
    const std::vector<std::string> parts = Split(text, separator);
    if (parts.size() == 2) {
        const auto first = Number<uint32_t>(parts[0]);
        const auto second = Number<uint32_t>(parts[1]);
        if (first && second && *first >= 1 && *second >= 1 && *first <= most && *second <= most) {
            return {*first, *second};
        }
        if (IsWholeNumber(parts[0]) && IsWholeNumber(parts[1])) {
            throw CUsageError(std::string(what) + ": " + std::string(text) +
                              " is out of range: each number 1 to " + std::to_string(most));
        }
    }
    Refuse(what, text, wanted);
}

} // namespace

double ParseTime(std::string_view what, std::string_view text) {
    constexpr std::string_view kWanted = "a time, such as 5s, 500ms, 2.5 or 1:30";
    constexpr double kMostSeconds = 1e6; // eleven days
    std::string_view digits = text;
    double unit = 1;
    if (digits.ends_with("ms")) {
        digits.remove_suffix(2);
        unit = 0.001;
    } else if (digits.ends_with("s")) {
        digits.remove_suffix(1);
    }
    const std::vector<std::string> parts = Split(digits, ':');
    if (parts.size() > 3 || (parts.size() > 1 && digits.size() != text.size())) {
        Refuse(what, text, kWanted);
    }
    double seconds = 0;
    for (size_t i = 0; i < parts.size(); ++i) {
        const auto number = Number<double>(parts[i]);
        const bool last = i + 1 == parts.size();
        if (!number || !(*number >= 0) || !(*number <= kMostSeconds) ||
            (!last && *number != std::floor(*number))) {
            Refuse(what, text, kWanted);
        }
        seconds = seconds * 60 + *number;
    }
    return seconds * unit;
}

Rational ParseRate(std::string_view what, std::string_view text) {
    constexpr std::string_view kWanted =
        "a frame rate, such as 25, 29.97 or 30000/1001, up to 1000";
    Rational rate;
    if (text.find('/') != std::string_view::npos) {
        const Size pair = ParsePair(what, text, '/', 100'000'000, kWanted);
        rate = {pair.width, pair.height};
    } else {
        const auto number = Number<double>(text);
        if (!number || std::isnan(*number)) {
            Refuse(what, text, kWanted);
        }
        if (*number < 0.001 || *number > 1000) {
            throw CUsageError(std::string(what) + ": " + std::string(text) +
                              " is out of range: 0.001 to 1000");
        }
        rate = {std::llround(*number * 1000), 1000};
    }
    if (rate.num == 0 || rate.Value() > 1000) {
        Refuse(what, text, kWanted);
    }
    const int64_t common = std::gcd(rate.num, rate.den);
    return {rate.num / common, rate.den / common};
}

Size ParseAspect(std::string_view what, std::string_view text) {
    return ParsePair(what, text, ':', 100'000, "an aspect ratio, such as 16:9");
}

Size ParseSize(std::string_view what, std::string_view text) {
    return ParsePair(what, text, 'x', 32768, "a size, such as 1920x1080, up to 32768x32768");
}

size_t ParseWord(std::string_view what, std::string_view text,
                 const std::vector<std::string>& words) {
    for (size_t i = 0; i < words.size(); ++i) {
        if (words[i] == text) {
            return i;
        }
    }
    Refuse(what, text, "one of " + Join(words, ", "));
}

std::filesystem::path ParsePath(std::string_view what, std::string_view text) {
    if (text.empty()) {
        throw CUsageError(std::string(what) + " is empty: name a file");
    }
    return PathOf(text);
}

std::vector<std::string> SplitWords(std::string_view what, std::string_view text) {
    std::vector<std::string> words;
    bool inWord = false;
    char quote = 0;
    for (const char c : text) {
        if (quote == 0 && c == ' ') {
            inWord = false;
            continue;
        }
        if (!inWord) {
            words.emplace_back();
            inWord = true;
        }
        if (quote == 0 && (c == '"' || c == '\'')) {
            quote = c;
        } else if (c == quote) {
            quote = 0;
        } else {
            words.back() += c;
        }
    }
    if (quote != 0) {
        Refuse(what, text, "complete: a quote has no end");
    }
    return words;
}

} // namespace kyvhost

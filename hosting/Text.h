// Small helpers for UTF-8 text, which is what every string of a host holds.
#pragma once

#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

namespace kyvhosting {

inline std::filesystem::path PathOf(std::string_view text) {
    return std::filesystem::path(std::u8string(text.begin(), text.end()));
}

inline std::string TextOf(const std::filesystem::path& path) {
    const std::u8string text = path.u8string();
    return std::string(text.begin(), text.end());
}

inline std::string Quoted(std::string_view text) {
    return "\"" + std::string(text) + "\"";
}

// Digits behind at most a sign, however many.
bool IsWholeNumber(std::string_view text);

// ASCII only, whatever the locale.
std::string Lower(std::string_view text);

// The parts between separators; one part when there is none.
std::vector<std::string> Split(std::string_view text, char separator);

std::string Join(const std::vector<std::string>& parts, std::string_view separator);

} // namespace kyvhosting

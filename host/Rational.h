// Frame rates, kept exact: 30000/1001 stays itself.
#pragma once

#include <cstdint>
#include <string>

#include "hosting/Text.h"

namespace kyvhost {

using kyvhosting::TextOf; // paths; the one below would hide it

struct Rational {
    int64_t num = 0;
    int64_t den = 1;

    bool operator==(const Rational&) const = default;
    double Value() const { return static_cast<double>(num) / static_cast<double>(den); }
};

// "30000/1001"
inline std::string TextOf(const Rational& number) {
    return std::to_string(number.num) + "/" + std::to_string(number.den);
}

// When a frame is shown, in the interface's units of 100 ns, rounded down.
inline int64_t PositionOfFrame(int64_t frame, const Rational& rate) {
    constexpr int64_t kSecond = 10'000'000;
    const int64_t scaled = frame * rate.den; // seconds times rate.num
    return scaled / rate.num * kSecond + scaled % rate.num * kSecond / rate.num;
}

} // namespace kyvhost

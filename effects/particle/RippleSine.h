// The sine that bends the water. C libraries differ in the last bit, so this one is ours, and every
// form of the kernel that uses it takes the same steps.
//
// The argument, up to a few hundred, is brought to -pi/2..pi/2 by the nearest multiple of pi and
// the rest goes through a polynomial, all in double precision with nothing contracted: the result
// is the sine rounded to single precision, but for ties that are as good as never met.
#pragma once

namespace kyv::ripple_sine {

inline constexpr double kOneOverPi = 0x1.45f306dc9c883p-2;

// pi in two parts; the first has 33 bits, so that up to 20 bits times it is exact.
inline constexpr double kPiHigh = 0x1.921fb544p+1;
inline constexpr double kPiLow = 0x1.0b4611a626331p-33;

// Adding and taking off 1.5 * 2^52 rounds to the nearest whole number and leaves its parity in the
// lowest bit of the sum.
inline constexpr double kRounder = 0x1.8p+52;

// The terms of the series of sin x / x in the square of x, beginning with the second and ending
// with that of x^16; what follows is less than 1e-13 of the sine.
inline constexpr int kTermCount = 8;
inline constexpr double kTerms[kTermCount] = {
    -1.0 / 6.0,        1.0 / 120.0,        -1.0 / 5040.0,          1.0 / 362880.0,
    -1.0 / 39916800.0, 1.0 / 6227020800.0, -1.0 / 1307674368000.0, 1.0 / 355687428096000.0};

} // namespace kyv::ripple_sine

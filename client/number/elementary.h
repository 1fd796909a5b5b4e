// Exponential, logarithm, sine, cosine and arc tangent of binary reals. A result has the precision of the argument and is
// off by at most 2^kLostBits units of its last bit, but where a line here says otherwise. Nothing allocates or fails.
#pragma once

#include "number/big_real.h"

namespace number {

constexpr int kLostBits = 56;

// e^x for |x| below 2^12.
BigReal Exponential(const BigReal& x);
// sinh(x) for |x| below 2^12.
BigReal HyperbolicSine(const BigReal& x);

// The natural logarithm of 1 + x, and of y, which is positive and differs from 1 by 2^-8 or more.
BigReal LogarithmNextToOne(const BigReal& x);  // |x| < 2^-8
BigReal Logarithm(const BigReal& y);

struct Angle {
    BigReal sine;
    BigReal cosine;
};
// Of x from 0 to below 1.
Angle SineAndCosine(const BigReal& x);
// From 0 to pi/2 for x >= 0.
BigReal ArcTangent(const BigReal& x);

}  // namespace number

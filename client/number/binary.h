// Where functions without an exact decimal result are computed: with a precision that grows until the decimal rounding is
// certain.
#pragma once

#include "handles/errors.h"
#include "number/big_real.h"
#include "number/elementary.h"

namespace number {

// Limbs of one attempt after the other. A value that the last one finds in the middle between two numbers is there: no
// function of numbers of 40 digits comes so near otherwise.
constexpr int kAttempts[] = {4, 8, 18};

// Of what is within its limits, the exponent of a function's argument or result in bits.
constexpr long kBeyondNumbers = 450;  // 2^420 is 1E126
constexpr long kBeyondPowers = 12;    // of an exponential's argument

// Computes and rounds. compute(limbs, BigReal* result, long* lost_bits) answers an error for what it can tell without
// a result; lost_bits, 0 at first, is how many bits fewer than usual are right.
template <class Compute> Errno Evaluate(Compute compute, OCINumber* result) {
    for (const int limbs : kAttempts) {
        BigReal real(limbs);
        long lost_bits = 0;
        if (const Errno error = compute(limbs, &real, &lost_bits)) return error;
        if (real.IsZero()) {
            SetZero(result);
            return 0;
        }
        if (real.Exponent() > kBeyondNumbers) return errors::kNumberOverflow;
        if (real.Exponent() < -kBeyondNumbers) return errors::kNumberUnderflow;
        Digits digits;
        const bool last = limbs == kAttempts[std::size(kAttempts) - 1];
        const long good_bits = BigReal::kLimbBits * limbs - kLostBits - lost_bits;
        if (ToDigits(real, good_bits, last, &digits)) return Pack(digits, result);
    }
    return errors::kNumberUnderflow;  // not reached: the last attempt decides
}

}  // namespace number

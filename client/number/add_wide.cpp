// Each digit of base 100 has a byte. The sums of all digits are taken at once; the carries, a byte each, move to the
// digit before. A carry that makes a 99 carry again, in one sum of ten, is sent once more. Written to few instructions,
// of which an addition is made: constants lie in memory, since compilers spend three to build one in a register.
#include "number/add_wide.h"

#include "number/digits.h"

#if defined(__x86_64__)
#include <immintrin.h>

namespace number {

// Made at compile time, yet not constant to the compiler; nobody writes it.
struct WideConstants {
    // Loaded from `window` + 20 - count: 0xFF in the place of each of the first `count` digits, 0 behind.
    std::uint8_t window[kMantissaDigits + 32] = {};
    alignas(32) std::uint8_t bytes_99[32] = {};
    alignas(32) std::uint8_t bytes_100[32] = {};
    alignas(32) std::uint8_t bytes_101[32] = {};
    alignas(32) std::uint32_t twenty[8] = {};  // the first 20 bytes
};
static constexpr WideConstants MakeWideConstants() {
    WideConstants made;
    for (int i = 0; i < kMantissaDigits; ++i) made.window[i] = 0xFF;
    for (int i = 0; i < 32; ++i) made.bytes_99[i] = 99, made.bytes_100[i] = 100, made.bytes_101[i] = 101;
    for (int i = 0; i < kMantissaDigits / 4; ++i) made.twenty[i] = 0xFFFFFFFF;
    return made;
}
extern WideConstants wide_constants;
constinit WideConstants wide_constants = MakeWideConstants();

namespace {

#define WIDE [[gnu::target("avx2"), gnu::always_inline]] inline

WIDE __m256i Load32(const void* bytes) { return _mm256_loadu_si256(static_cast<const __m256i*>(bytes)); }

WIDE bool IsZero(__m256i bytes) { return _mm256_testz_si256(bytes, bytes) != 0; }

// The digits of a mantissa, one a byte, and 0 behind them. A byte that is no digit's becomes one above 99.
template <bool kNegative> WIDE __m256i DigitsOf(const std::uint8_t* bytes) {
    std::size_t count = bytes[0] - std::size_t{1};
    if (kNegative) count -= bytes[1 + count] == detail::kTerminator;
    const __m256i first = Load32(wide_constants.window + kMantissaDigits - count);
    const __m256i stored =
        _mm256_maskload_epi32(reinterpret_cast<const int*>(bytes + 2), Load32(wide_constants.twenty));
    const __m256i kept = _mm256_and_si256(stored, first);
    if (kNegative) return _mm256_sub_epi8(_mm256_and_si256(Load32(wide_constants.bytes_101), first), kept);
    return _mm256_add_epi8(kept, first);
}

// Takes 100 from the digits that carry, which are marked with 0xFF, and adds 1 to those before them.
WIDE __m256i Carry(__m256i sum, __m256i carries) {
    const __m256i before = _mm256_alignr_epi8(_mm256_permute2x128_si256(carries, carries, 0x81), carries, 1);
    return _mm256_sub_epi8(_mm256_sub_epi8(sum, _mm256_and_si256(carries, Load32(wide_constants.bytes_100))), before);
}
WIDE unsigned CarryOut(__m256i carries) { return static_cast<unsigned>(_mm256_movemask_epi8(carries)) & 1; }

template <bool kNegative> WIDE bool Add(const std::uint8_t* left, const std::uint8_t* right, OCINumber* result) {
    // A zero in front, or in a negative number no digit at all.
    if (kNegative ? left[2] > 100 || right[2] > 100 : left[2] < 2) return false;
    const __m256i a = DigitsOf<kNegative>(left), b = DigitsOf<kNegative>(right);
    const __m256i malformed = _mm256_subs_epu8(_mm256_max_epu8(a, b), Load32(wide_constants.bytes_99));
    const __m256i raw = _mm256_add_epi8(a, b), hundred = Load32(wide_constants.bytes_100);
    __m256i carries = _mm256_cmpeq_epi8(_mm256_max_epu8(raw, hundred), raw);
    unsigned carry = CarryOut(carries);
    __m256i sum = Carry(raw, carries);
    carries = _mm256_cmpeq_epi8(sum, hundred);
    if (!IsZero(_mm256_or_si256(malformed, carries))) {
        if (!IsZero(malformed)) return false;
        for (; !IsZero(carries); carries = _mm256_cmpeq_epi8(sum, hundred)) {
            carry |= CarryOut(carries);
            sum = Carry(sum, carries);
        }
    }
    const auto zeros = static_cast<unsigned>(_mm256_movemask_epi8(_mm256_cmpeq_epi8(sum, _mm256_setzero_si256())));
    const unsigned beyond = static_cast<unsigned>(std::countl_zero(~zeros));  // 32 - digits
    const unsigned count = 32 - beyond + carry;
    if (count > kMantissaDigits || left[1] == (kNegative ? 0 : 255)) return false;
    const __m256i first = Load32(wide_constants.window + beyond - (32 - kMantissaDigits));
    const __m256i stored = kNegative
                               ? _mm256_sub_epi8(_mm256_and_si256(Load32(wide_constants.bytes_101), first), sum)
                               : _mm256_sub_epi8(sum, first);
    // A carry out of the first digit goes in front; the digits are stored a byte further on then.
    std::uint8_t* const bytes = result->OCINumberPart;
    const bool closed = kNegative && count < kMantissaDigits;
    const auto last = static_cast<std::uint32_t>(_mm_cvtsi128_si32(_mm256_extracti128_si256(stored, 1)));
    const std::uint32_t shifted = last << carry * 8;
    bytes[0] = static_cast<std::uint8_t>(1 + count + closed);
    bytes[1] = static_cast<std::uint8_t>(kNegative ? left[1] - carry : left[1] + carry);
    bytes[2] = kNegative ? 100 : 2;
    std::memcpy(bytes + 18, &shifted, sizeof shifted);
    _mm_storeu_si128(reinterpret_cast<__m128i*>(bytes + 2 + carry), _mm256_castsi256_si128(stored));
    if (closed) bytes[2 + count] = detail::kTerminator;
    return true;
}

[[gnu::target("avx2"), gnu::noinline]] Errno AddNegative(const OCINumber& left, const OCINumber& right,
                                                         OCINumber* result) noexcept {
    if (Add<true>(left.OCINumberPart, right.OCINumberPart, result)) return 0;
    return AddNarrow(left, right, result);
}

}  // namespace

[[gnu::target("avx2")]] Errno AddWide(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept {
    const bool alike = left.OCINumberPart[1] == right.OCINumberPart[1] && HasMantissa(left) && HasMantissa(right);
    if (alike && left.OCINumberPart[1] < 128) return AddNegative(left, right, result);
    if (alike && Add<false>(left.OCINumberPart, right.OCINumberPart, result)) return 0;
    return AddNarrow(left, right, result);
}

bool CanAddWide() noexcept { return __builtin_cpu_supports("avx2") != 0; }

}  // namespace number

#else

namespace number {

bool CanAddWide() noexcept { return false; }
Errno AddWide(const OCINumber& left, const OCINumber& right, OCINumber* result) noexcept {
    return AddNarrow(left, right, result);
}

}  // namespace number

#endif

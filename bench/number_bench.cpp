// What numbers cost, each beside the same work done another way in the same run: arithmetic beside GMP on values
// already in its own form (whole numbers for sums, floats of 40 digits where results are rounded), functions beside
// MPFR at the precision that 40 right digits need, and text and functions beside Python's decimal module at 40 digits.
//   number_bench [runs]
#include <gmp.h>
#include <mpfr.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <random>
#include <string>
#include <vector>

#include "number/number.h"

namespace {

constexpr int kValues = 64;
constexpr int kDigits = 38;
constexpr mpfr_prec_t kFloatBits = 133;     // 40 digits
constexpr mpfr_prec_t kFunctionBits = 160;  // and what it takes to round them

// Nanoseconds an operation, over one short slice.
template <class Work> double Slice(int count, Work& work) {
    const auto start = std::chrono::steady_clock::now();
    for (int i = 0; i < count; ++i) work(i);
    const std::chrono::duration<double, std::nano> elapsed = std::chrono::steady_clock::now() - start;
    return elapsed.count() / count;
}

double Median(std::vector<double> values) {
    std::sort(values.begin(), values.end());
    return values[values.size() / 2];
}

int runs = 5;

constexpr int kSlicesPerRun = 100;

void Report(const char* what, double goal, double ratio, double ours, double theirs) {
    std::printf("%-52s %6.2f x  (goal %.1f)  %8.1f ns, %8.1f ns\n", what, ratio, goal, ours, theirs);
    std::fflush(stdout);
}

// Short slices in turn, so that what else the machine does meets both; the median of the ratios slice by slice.
template <class Ours, class Theirs> void Pair(const char* what, double goal, int count, Ours ours, Theirs theirs) {
    std::vector<double> ratios, mine, other;
    for (int slice = 0; slice < runs * kSlicesPerRun; ++slice) {
        mine.push_back(Slice(count, ours));
        other.push_back(Slice(count, theirs));
        ratios.push_back(mine.back() / other.back());
    }
    Report(what, goal, Median(ratios), Median(mine), Median(other));
}

template <class Work> double Nanoseconds(int count, Work work) {
    std::vector<double> slices;
    for (int slice = 0; slice < runs * kSlicesPerRun; ++slice) slices.push_back(Slice(count, work));
    return Median(slices);
}

// Digits that begin and end with one that is not 0.
std::string RandomDigits(std::mt19937& engine) {
    std::string digits;
    for (int i = 0; i < kDigits; ++i) digits += static_cast<char>('1' + engine() % 9);
    return digits;
}

struct Values {
    OCINumber number[kValues], fraction[kValues];
    std::string text[kValues];
    mpz_t whole[kValues];
    mpf_t floating[kValues];
    mpfr_t real[kValues];

    explicit Values(unsigned seed) {
        std::mt19937 engine(seed);
        for (int i = 0; i < kValues; ++i) {
            const std::string digits = RandomDigits(engine);
            text[i] = digits.substr(0, 20) + "." + digits.substr(20);
            number::FromPlainText(digits, '.', &number[i]);
            number::FromPlainText("." + digits, '.', &fraction[i]);
            mpz_init_set_str(whole[i], digits.c_str(), 10);
            mpf_init2(floating[i], kFloatBits);
            mpf_set_str(floating[i], text[i].c_str(), 10);
            mpfr_init2(real[i], kFunctionBits);
            mpfr_set_str(real[i], ("." + digits).c_str(), 10, MPFR_RNDN);
        }
    }
};

int At(int i) { return i & (kValues - 1); }
int Other(int i) { return (i / kValues + i) & (kValues - 1); }

using Whole = void (*)(mpz_ptr, mpz_srcptr, mpz_srcptr);
using Floating = void (*)(mpf_ptr, mpf_srcptr, mpf_srcptr);
using Function = int (*)(mpfr_ptr, mpfr_srcptr, mpfr_rnd_t);

void BesideGmp(const Values& a, const Values& b) {
    OCINumber result;
    mpz_t whole;
    mpf_t floating;
    mpz_init2(whole, 256);
    mpf_init2(floating, kFloatBits);
    constexpr int kCount = 4096;
    const auto ours = [&](number::Binary function) {
        return [&, function](int i) { function(a.number[At(i)], b.number[Other(i)], &result); };
    };
    const struct {
        const char* what;
        number::Binary ours;
        Whole theirs;
    } sums[] = {{"add, 38 digits / mpz_add", number::Add, mpz_add},
                {"subtract, 38 digits / mpz_sub", number::Sub, mpz_sub}};
    for (const auto& row : sums)
        Pair(row.what, 2, kCount, ours(row.ours), [&](int i) { row.theirs(whole, a.whole[At(i)], b.whole[Other(i)]); });
    const struct {
        const char* what;
        number::Binary ours;
        Floating theirs;
    } products[] = {{"multiply, 38 digits / mpf_mul", number::Mul, mpf_mul},
                    {"divide, 38 digits / mpf_div", number::Div, mpf_div}};
    for (const auto& row : products)
        Pair(row.what, 3.5, kCount, ours(row.ours),
             [&](int i) { row.theirs(floating, a.floating[At(i)], b.floating[Other(i)]); });
    Pair(
        "square root, 38 digits / mpf_sqrt", 3.5, kCount, [&](int i) { number::Sqrt(a.number[At(i)], &result); },
        [&](int i) { mpf_sqrt(floating, a.floating[At(i)]); });
    mpz_clear(whole);
    mpf_clear(floating);
}

void BesideMpfr(const Values& a) {
    const struct {
        const char* what;
        number::Unary ours;
        Function theirs;
    } rows[] = {{"sine / mpfr_sin at 160 bits", number::Sin, mpfr_sin},
                {"exponential / mpfr_exp at 160 bits", number::Exp, mpfr_exp},
                {"logarithm / mpfr_log at 160 bits", number::Ln, mpfr_log}};
    OCINumber result;
    mpfr_t real;
    mpfr_init2(real, kFunctionBits);
    for (const auto& row : rows)
        Pair(
            row.what, 2, 64, [&](int i) { row.ours(a.fraction[At(i)], &result); },
            [&](int i) { row.theirs(real, a.real[At(i)], MPFR_RNDN); });
    mpfr_clear(real);
}

// The nanoseconds that Python's decimal takes for each statement, less what the timing loop itself takes. Its figures
// cannot be taken in turn with ours: one interpreter runs for all of them.
std::vector<double> PythonNanoseconds(const Values& a, const std::vector<std::string>& statements) {
    std::string script =
        "import decimal,timeit\ndecimal.getcontext().prec=40\nD=decimal.Decimal\ns='" + a.text[0] +
        "'\nx=D(s)\ny=x.scaleb(-20)\nt=lambda w:min(timeit.repeat(w,globals=globals(),number=5000,repeat=7))\n"
        "e=t('pass')\n";
    for (const std::string& statement : statements) script += "print((t('" + statement + "')-e)/5000*1e9)\n";
    std::vector<double> figures;
    if (FILE* pipe = popen(("python3 -c \"" + script + "\"").c_str(), "r")) {
        double figure = 0;
        while (std::fscanf(pipe, "%lf", &figure) == 1) figures.push_back(figure);
        pclose(pipe);
    }
    return figures;
}

void BesidePython(const Values& a) {
    OCINumber result;
    char text[number::kMaxPlainText];
    std::size_t length = 0;
    OCINumber parsed[kValues];
    for (int i = 0; i < kValues; ++i) number::FromPlainText(a.text[i], '.', &parsed[i]);
    const struct {
        const char* what;
        const char* statement;
        double goal;
        double ours;
    } rows[] = {
        {"square root / decimal", "x.sqrt()", 1,
         Nanoseconds(512, [&](int i) { number::Sqrt(a.number[At(i)], &result); })},
        {"exponential / decimal", "y.exp()", 1,
         Nanoseconds(64, [&](int i) { number::Exp(a.fraction[At(i)], &result); })},
        {"logarithm / decimal", "y.ln()", 1, Nanoseconds(64, [&](int i) { number::Ln(a.fraction[At(i)], &result); })},
        {"number to text / decimal", "str(x)", 2,
         Nanoseconds(1024, [&](int i) { number::ToPlainText(parsed[At(i)], '.', text, &length); })},
        {"text to number / decimal", "D(s)", 2,
         Nanoseconds(1024, [&](int i) { number::FromPlainText(a.text[At(i)], '.', &result); })}};
    std::vector<std::string> statements;
    for (const auto& row : rows) statements.emplace_back(row.statement);
    const std::vector<double> theirs = PythonNanoseconds(a, statements);
    if (theirs.size() != statements.size()) {
        std::printf("python3 with its decimal module did not run: no figures beside it\n");
        return;
    }
    for (std::size_t i = 0; i < theirs.size(); ++i)
        Report(rows[i].what, rows[i].goal, rows[i].ours / theirs[i], rows[i].ours, theirs[i]);
}

}  // namespace

int main(int count, char** arguments) {
    if (count > 1) runs = std::max(std::atoi(arguments[1]), 1);
    const Values a(1), b(2);
    BesideGmp(a, b);
    BesideMpfr(a);
    BesidePython(a);
    return 0;
}

#include <gtest/gtest.h>

#include <climits>
#include <limits>
#include <sstream>
#include <string>
#include <tuple>

#include "ZelUnicodeString.h"

namespace {

using Z = ZelUnicodeString;
using ::testing::PrintToString;
constexpr int F = Z::kForward;
constexpr int B = Z::kBackward;

TEST(ZelUnicodeStringTest, SearchFindsTheFirstOrLastOccurrenceOrMinusOne) {
    // text, needle, start, mode, expected
    const std::tuple<const char*, const char*, int, int, int> cases[] = {
        // clang-format off
        // A negative start searches from 0; occurrences may overlap; positions are bytes.
        {"abcabc", "bc", 0, F, 1},  {"abcabc", "bc", 1, F, 1},   {"abcabc", "bc", 2, F, 4},
        {"abcabc", "bc", 5, F, -1}, {"abcabc", "bc", -5, F, 1},  {"abcabc", "x", 0, F, -1},
        {"abcabc", "abcabcd", 0, F, -1}, {"aaa", "aa", 1, F, 1}, {"abcabc", "", 3, F, 3},
        {"abcabc", "", 6, F, 6},    {"abcabc", "", 7, F, -1},    {"abcabc", "a", 100, F, -1},
        {"", "", 0, F, 0},          {"", "a", 0, F, -1},         {"h\xC3\xA9llo", "llo", 0, F, 3},
        {"abcabc", "bc", -1, B, 4}, {"abcabc", "bc", 100, B, 4}, {"abcabc", "bc", 5, B, 4},
        {"abcabc", "bc", 4, B, 4},  {"abcabc", "bc", 3, B, 1},   {"abcabc", "bc", 0, B, -1},
        {"abcabc", "abc", 0, B, 0}, {"aaa", "aa", -1, B, 1},     {"abcabc", "x", -1, B, -1},
        {"abcabc", "", -1, B, 6},   {"", "a", -1, B, -1},        {"a.b.c", ".", -1, B, 3},
        // clang-format on
    };
    for (const auto& [text, needle, start, mode, expected] : cases)
        EXPECT_EQ(Z(text).SearchSubString(needle, start, mode), expected)
            << text << " " << needle << start << " " << mode;
}

TEST(ZelUnicodeStringTest, SubStringClipsToTheText) {
    const std::tuple<const char*, int, int, const char*> cases[] = {
        // clang-format off
        {"hello", 0, -1, "hello"}, {"hello", 1, 3, "ell"}, {"hello", 3, 100, "lo"}, {"", 0, 3, ""},
        {"hello", 2, 0, ""}, {"hello", 5, 1, ""}, {"hello", 99, 2, ""}, {"hello", -3, 2, "he"},
        {"hello", 4, -7, "o"}, {"h\xC3\xA9llo", 1, 2, "\xC3\xA9"},
        // clang-format on
    };
    for (const auto& [text, start, count, expected] : cases)
        EXPECT_EQ(Z(text).SubString(start, count), expected) << text << " " << start << count;
}

TEST(ZelUnicodeStringTest, ReplaceTheFirstOccurrenceOrEveryOne) {
    // text, from, to, after ReplaceSubString, after ReplaceAll, ReplaceAll's count
    using S = const char*;
    const std::tuple<S, S, S, S, S, int> cases[] = {
        // clang-format off
        // Replaced text is not scanned again.
        {"a.b.c", ".", "::", "a::b.c", "a::b::c", 2}, {"aaaa", "aa", "a", "aaa", "aa", 2},
        {"abc", "b", "bb", "abbc", "abbc", 1},        {"aaa", "aa", "b", "ba", "ba", 1},
        {"xx", "x", "", "x", "", 2},                  {"abc", "abc", "", "", "", 1},
        {"abc", "z", "y", "abc", "abc", 0},           {"abc", "", "y", "abc", "abc", 0},
        {"", "a", "b", "", "", 0},
        {"caf\xC3\xA9 caf\xC3\xA9", "\xC3\xA9", "e", "cafe caf\xC3\xA9", "cafe cafe", 2},
        // clang-format on
    };
    for (const auto& [text, from, to, afterFirst, afterAll, count] : cases) {
        SCOPED_TRACE(Z(text) + " " + from);
        Z first(text), all(text);
        EXPECT_EQ(first.ReplaceSubString(from, to), count > 0);
        EXPECT_EQ(all.ReplaceAll(from, to), count);
        EXPECT_EQ(first, afterFirst);
        EXPECT_EQ(all, afterAll);
    }
}

// `value` formatted into a string that held other text; without a format, by the default one.
const char kDefault[] = "default";
template <typename T>
std::string N(T value, const char* format = kDefault) {
    Z text("previous text");
    return (format == kDefault ? text.BuildFromNum(value) : text.BuildFromNum(value, format)).str();
}

// The conversion letter decides how the value is shown, whatever its type; an integer keeps its
// own width as printf would show it.
TEST(ZelUnicodeStringTest, BuildFromNumFormatsEachNumberType) {
    using D = std::numeric_limits<double>;
    const double nan = D::quiet_NaN(), inf = D::infinity();
    const std::pair<std::string, std::string> cases[] = {
        // clang-format off
        {N(42, "%d"), "42"}, {N(-7, "%5d"), "   -7"}, {N(-7, "%-4d|"), "-7  |"},
        {N(8u, "%o"), "10"}, {N(5, "id=%03d;"), "id=005;"}, {N(5, "100%% %d"), "100% 5"},
        {N(255, "%x"), "ff"}, {N(255, "%#X"), "0XFF"}, {N(INT_MIN, "%d"), "-2147483648"},
        {N(-5, "%I64d"), "-5"}, {N(INT_MAX, "%+d"), "+2147483647"},
        {N(UINT_MAX, "%u"), "4294967295"}, {N(LLONG_MAX, "%I64d"), "9223372036854775807"},
        {N(-1LL, "%I64x"), "ffffffffffffffff"}, {N(LLONG_MIN, "%I64d"), "-9223372036854775808"},
        {N(LLONG_MIN, "%lld"), "-9223372036854775808"},
        {N(ULLONG_MAX, "%I64u"), "18446744073709551615"},
        {N(ULLONG_MAX, "%I64X"), "FFFFFFFFFFFFFFFF"},
        {N(ULLONG_MAX, "%llu"), "18446744073709551615"}, {N(0ULL, "%I64u"), "0"},
        {N(0.5, "%g"), "0.5"}, {N(123456789.0, "%g"), "1.23457e+08"}, {N(-0.0, "%g"), "-0"},
        {N(D::max(), "%g"), "1.79769e+308"}, {N(D::denorm_min(), "%g"), "4.94066e-324"},
        {N(inf, "%g"), "inf"}, {N(-inf, "%g"), "-inf"}, {N(nan, "%g"), "nan"},
        {N(1.0 / 3, "%.3f"), "0.333"}, {N(2.5, "%e"), "2.500000e+00"},
        {N(2.5, "x=%8.2f!"), "x=    2.50!"},
        // Texts as long as the first buffer, the largest field accepted, and the default format of
        // each overload.
        {N(1, "%064d"), std::string(63, '0') + "1"}, {N(7, "%4096d"), std::string(4095, ' ') + "7"},
        {N(-12), "-12"}, {N(UINT_MAX), "4294967295"}, {N(0.25), "0.25"},
        {N(LLONG_MIN), "-9223372036854775808"}, {N(ULLONG_MAX), "18446744073709551615"},
        // A letter that does not match the type: integers widened to double, doubles truncated
        // toward zero and saturated, NaN as 0.
        {N(3, "%.2f"), "3.00"}, {N(LLONG_MAX, "%g"), "9.22337e+18"}, {N(ULLONG_MAX, "%d"), "-1"},
        {N(-1, "%u"), "4294967295"}, {N(UINT_MAX, "%d"), "-1"},
        {N(-1LL, "%u"), "18446744073709551615"}, {N(2.75, "%d"), "2"}, {N(-2.75, "%d"), "-2"},
        {N(1e300, "%d"), "9223372036854775807"}, {N(-1e300, "%I64d"), "-9223372036854775808"},
        {N(1e300, "%I64u"), "18446744073709551615"}, {N(-3.5, "%x"), "fffffffffffffffd"},
        {N(nan, "%d"), "0"}, {N(nan, "%u"), "0"}, {N(inf, "%c"), "\xFF"}, {N(65.9, "%c"), "A"},
        // clang-format on
    };
    for (const auto& [built, expected] : cases) EXPECT_EQ(built, expected);
    EXPECT_EQ(N(1.0, "%.4096f").size(), 4098u);
}

// A format that cannot format one number must neither read a missing argument nor write through
// one: it falls back to the overload's default format.
TEST(ZelUnicodeStringTest, BuildFromNumFallsBackFromAnUnusableFormat) {
    const char* const formats[] = {
        // clang-format off
        "%s", "%n", "%p", "%*d", "%5*d", "%.*f", "%d %d", "%s%s%s%n", "", "text", "%", "abc%",
        "%I64", "%l", "%1.2.3d", "%5-d", "%-05", "%q", "%%", "%10000d", "%.5000f",
        "%99999999999999999999d", nullptr,
        // clang-format on
    };
    for (const char* format : formats) {
        const char* shown = format != nullptr ? format : "(null)";
        EXPECT_EQ(N(-42, format) + " " + N(UINT_MAX, format), "-42 4294967295") << shown;
        EXPECT_EQ(N(0.5, format) + " " + N(LLONG_MIN, format) + " " + N(ULLONG_MAX, format),
                  "0.5 -9223372036854775808 18446744073709551615")
            << shown;
    }
}

TEST(ZelUnicodeStringTest, LengthInCharCountsCodePointsAndEachInvalidByte) {
    const std::pair<std::string, int> cases[] = {
        // clang-format off
        // Valid: NUL like any other character, then U+0080, U+00E9, U+20AC, U+D7FF, U+FFFF,
        // U+1F600 and U+10FFFF.
        {"", 0}, {"abc", 3}, {std::string("a\0b", 3), 3}, {"\xC2\x80", 1}, {"\xC3\xA9", 1},
        {"\xE2\x82\xAC", 1}, {"\xED\x9F\xBF", 1}, {"\xEF\xBF\xBF", 1}, {"\xF0\x9F\x98\x80", 1},
        {"\xF4\x8F\xBF\xBF", 1}, {"a\xE2\x82\xAC" "b", 3},
        // Invalid: a byte that is no lead, continuations without a lead, truncated sequences,
        // overlong forms, surrogates, code points above U+10FFFF, five-byte forms, and one bad
        // byte between two good characters.
        {"\xFF", 1}, {"\x80\x80", 2}, {"\xC3", 1}, {"\xC3" "A", 2}, {"\xE2\x82" "A", 3},
        {"\xF0\x9F\x98", 3}, {"\xC0\x80", 2}, {"\xC1\xBF", 2}, {"\xE0\x80\x80", 3},
        {"\xE0\x9F\xBF", 3}, {"\xF0\x80\x80\x80", 4}, {"\xF0\x8F\xBF\xBF", 4},
        {"\xED\xA0\x80", 3}, {"\xED\xBF\xBF", 3}, {"\xF4\x90\x80\x80", 4},
        {"\xF5\x80\x80\x80", 4}, {"\xF8\x88\x80\x80\x80", 5}, {"\xC3\xA9\xFF\xC3\xA9", 3},
        // clang-format on
    };
    for (const auto& [text, chars] : cases)
        EXPECT_EQ(Z(text).GetLengthInChar(), chars) << PrintToString(text);
}

// Comparisons are exact: a NUL and what follows count, a null pointer is the empty text, case
// matters, and the order is byte order with bytes compared unsigned, which is code-point order
// (U+20AC < U+1F600, U+FFFF < U+10000).
TEST(ZelUnicodeStringTest, ComparisonIsExactAndInByteOrder) {
    // text, other, and the sign of text - other
    const std::tuple<Z, const char*, int> cases[] = {
        // clang-format off
        {"abc", "abc", 0}, {"abc", "abd", -1}, {"abc", "ab", 1}, {"ab", "abc", -1}, {"ab", "b", -1},
        {"abc", "ABC", 1}, {"Z", "a", -1}, {"", "", 0}, {"", "a", -1}, {"", nullptr, 0},
        {"x", nullptr, 1}, {Z("a\0b", 3), "a", 1}, {Z(nullptr, 3), "", 0}, {"\x7F", "\x80", -1},
        {Z(static_cast<const char*>(nullptr)), "", 0}, {"z", "\xC3\xA9", -1},
        {"\xE2\x82\xAC", "\xF0\x9F\x98\x80", -1}, {"\xEF\xBF\xBF", "\xF0\x90\x80\x80", -1},
        // clang-format on
    };
    for (const auto& [text, other, sign] : cases) {
        SCOPED_TRACE(PrintToString(text.str()) + " / " + PrintToString(other ? other : "(null)"));
        EXPECT_EQ(text == other, sign == 0);
        EXPECT_EQ(other == text, sign == 0);
        EXPECT_EQ(text != other, sign != 0);
        EXPECT_EQ(other != text, sign != 0);
        EXPECT_EQ(text < Z(other), sign < 0);
        EXPECT_EQ(Z(other) < text, sign > 0);
    }
}

TEST(ZelUnicodeStringTest, ConcatenationStreamingAndHashing) {
    const Z left("Parameters::");
    const Z right("ReadInt32()");
    EXPECT_EQ(left + right, "Parameters::ReadInt32()");
    EXPECT_EQ(left + "ReadInt32()", "Parameters::ReadInt32()");
    EXPECT_EQ("<" + right + ">", "<ReadInt32()>");

    Z text("a");
    (text += "b") += Z("c");
    text.Append("d").Append(Z("e")).Append(nullptr) += static_cast<const char*>(nullptr);
    EXPECT_EQ(text, "abcde");
    EXPECT_EQ(static_cast<const char*>(nullptr) + text + static_cast<const char*>(nullptr), text);
    text += text;
    EXPECT_EQ(text, "abcdeabcde");

    std::ostringstream out;
    out << "[" << Z(std::string("caf\xC3\xA9\0!", 7)) << "]";
    EXPECT_EQ(out.str(), std::string("[caf\xC3\xA9\0!]", 9));
    EXPECT_EQ(std::hash<Z>()(left + right), std::hash<Z>()(Z("Parameters::ReadInt32()")));
}

}  // namespace

#include <gtest/gtest.h>

#include <climits>
#include <cmath>
#include <limits>
#include <map>
#include <sstream>
#include <string>
#include <unordered_map>
#include <unordered_set>
#include <vector>

#include "ZelUnicodeString.h"

namespace {

constexpr int F = ZelUnicodeString::kForward;
constexpr int B = ZelUnicodeString::kBackward;

struct SearchCase {
    const char* text;
    const char* needle;
    int start;
    int mode;
    int expected;
};

TEST(ZelUnicodeStringSearch, FindsFirstOrLastOccurrenceOrMinusOne) {
    const SearchCase cases[] = {
        {"abcabc", "bc", 0, F, 1},
        {"abcabc", "bc", 1, F, 1},
        {"abcabc", "bc", 2, F, 4},
        {"abcabc", "bc", 5, F, -1},
        {"abcabc", "bc", -5, F, 1},  // a negative start searches from the beginning
        {"abcabc", "x", 0, F, -1},
        {"abcabc", "abcabcd", 0, F, -1},
        {"aaa", "aa", 1, F, 1},  // overlapping occurrences count
        {"abcabc", "", 3, F, 3},
        {"abcabc", "", 6, F, 6},
        {"abcabc", "", 7, F, -1},
        {"abcabc", "a", 100, F, -1},
        {"", "", 0, F, 0},
        {"", "a", 0, F, -1},
        {"h\xC3\xA9llo", "llo", 0, F, 3},  // positions are bytes

        {"abcabc", "bc", -1, B, 4},
        {"abcabc", "bc", 100, B, 4},
        {"abcabc", "bc", 5, B, 4},
        {"abcabc", "bc", 4, B, 4},
        {"abcabc", "bc", 3, B, 1},
        {"abcabc", "bc", 0, B, -1},
        {"abcabc", "abc", 0, B, 0},
        {"aaa", "aa", -1, B, 1},
        {"abcabc", "x", -1, B, -1},
        {"abcabc", "", -1, B, 6},
        {"", "a", -1, B, -1},
        {"a.b.c", ".", -1, B, 3},
    };
    for (const SearchCase& c : cases) {
        EXPECT_EQ(ZelUnicodeString(c.text).SearchSubString(c.needle, c.start, c.mode), c.expected)
            << "\"" << c.text << "\" / \"" << c.needle << "\" from " << c.start << " mode "
            << c.mode;
    }
}

struct SubStringCase {
    const char* text;
    int start;
    int count;
    const char* expected;
};

TEST(ZelUnicodeStringSubString, ClipsToTheText) {
    const SubStringCase cases[] = {
        {"hello", 0, -1, "hello"},
        {"hello", 1, 3, "ell"},
        {"hello", 3, 100, "lo"},
        {"hello", 2, 0, ""},
        {"hello", 5, 1, ""},
        {"hello", 99, 2, ""},
        {"hello", -3, 2, "he"},
        {"hello", 4, -7, "o"},
        {"", 0, 3, ""},
        {"h\xC3\xA9llo", 1, 2, "\xC3\xA9"},
    };
    for (const SubStringCase& c : cases) {
        EXPECT_EQ(ZelUnicodeString(c.text).SubString(c.start, c.count), c.expected)
            << "\"" << c.text << "\" " << c.start << "," << c.count;
    }
}

struct ReplaceCase {
    const char* text;
    const char* from;
    const char* to;
    const char* first;  // after ReplaceSubString
    const char* all;    // after ReplaceAll
    int count;          // ReplaceAll's result
};

TEST(ZelUnicodeStringReplace, FirstOccurrenceAndEveryOccurrence) {
    const ReplaceCase cases[] = {
        {"a.b.c", ".", "::", "a::b.c", "a::b::c", 2},
        {"aaaa", "aa", "a", "aaa", "aa", 2},  // replaced text is not scanned again
        {"abc", "b", "bb", "abbc", "abbc", 1},
        {"aaa", "aa", "b", "ba", "ba", 1},
        {"xx", "x", "", "x", "", 2},
        {"abc", "abc", "", "", "", 1},
        {"abc", "z", "y", "abc", "abc", 0},
        {"abc", "", "y", "abc", "abc", 0},
        {"", "a", "b", "", "", 0},
        {"caf\xC3\xA9 caf\xC3\xA9", "\xC3\xA9", "e", "cafe caf\xC3\xA9", "cafe cafe", 2},
    };
    for (const ReplaceCase& c : cases) {
        ZelUnicodeString first(c.text);
        EXPECT_EQ(first.ReplaceSubString(c.from, c.to), c.count > 0) << c.text << " " << c.from;
        EXPECT_EQ(first, c.first) << c.text << " " << c.from;
        ZelUnicodeString all(c.text);
        EXPECT_EQ(all.ReplaceAll(c.from, c.to), c.count) << c.text << " " << c.from;
        EXPECT_EQ(all, c.all) << c.text << " " << c.from;
    }
}

TEST(ZelUnicodeStringReplace, CopiesAreIndependent) {
    ZelUnicodeString original("a-b-c");
    ZelUnicodeString copy = original;
    copy.ReplaceAll("-", "+");
    EXPECT_EQ(original, "a-b-c");
    EXPECT_EQ(copy, "a+b+c");
}

template <typename T>
std::string Build(T value, const char* format) {
    ZelUnicodeString text("previous text");
    return text.BuildFromNum(value, format).str();
}

struct FormatCase {
    std::string built;
    const char* expected;
};

TEST(ZelUnicodeStringBuildFromNum, FormatsEachNumberType) {
    const double nan = std::numeric_limits<double>::quiet_NaN();
    const double inf = std::numeric_limits<double>::infinity();
    const FormatCase cases[] = {
        {Build(42, "%d"), "42"},
        {Build(-7, "%5d"), "   -7"},
        {Build(-7, "%-4d|"), "-7  |"},
        {Build(5, "id=%03d;"), "id=005;"},
        {Build(5, "100%% %d"), "100% 5"},
        {Build(255, "%x"), "ff"},
        {Build(255, "%#X"), "0XFF"},
        {Build(INT_MIN, "%d"), "-2147483648"},
        {Build(INT_MAX, "%+d"), "+2147483647"},
        {Build(-5, "%I64d"), "-5"},
        {Build(UINT_MAX, "%u"), "4294967295"},
        {Build(8u, "%o"), "10"},
        {Build(LLONG_MAX, "%I64d"), "9223372036854775807"},
        {Build(LLONG_MIN, "%I64d"), "-9223372036854775808"},
        {Build(LLONG_MIN, "%lld"), "-9223372036854775808"},
        {Build(-1LL, "%I64x"), "ffffffffffffffff"},
        {Build(0LL, "%I64d"), "0"},
        {Build(ULLONG_MAX, "%I64u"), "18446744073709551615"},
        {Build(ULLONG_MAX, "%I64X"), "FFFFFFFFFFFFFFFF"},
        {Build(ULLONG_MAX, "%llu"), "18446744073709551615"},
        {Build(0ULL, "%I64u"), "0"},
        {Build(0.5, "%g"), "0.5"},
        {Build(1e20, "%g"), "1e+20"},
        {Build(123456789.0, "%g"), "1.23457e+08"},
        {Build(std::numeric_limits<double>::max(), "%g"), "1.79769e+308"},
        {Build(std::numeric_limits<double>::denorm_min(), "%g"), "4.94066e-324"},
        {Build(-0.0, "%g"), "-0"},
        {Build(inf, "%g"), "inf"},
        {Build(-inf, "%g"), "-inf"},
        {Build(nan, "%g"), "nan"},
        {Build(1.0 / 3, "%.3f"), "0.333"},
        {Build(2.5, "%e"), "2.500000e+00"},
        {Build(2.5, "x=%8.2f!"), "x=    2.50!"},
    };
    for (const FormatCase& c : cases) EXPECT_EQ(c.built, c.expected);
}

TEST(ZelUnicodeStringBuildFromNum, DefaultFormats) {
    EXPECT_EQ(ZelUnicodeString().BuildFromNum(-12), "-12");
    EXPECT_EQ(ZelUnicodeString().BuildFromNum(12u), "12");
    EXPECT_EQ(ZelUnicodeString().BuildFromNum(0.25), "0.25");
    EXPECT_EQ(ZelUnicodeString().BuildFromNum(LLONG_MIN), "-9223372036854775808");
    EXPECT_EQ(ZelUnicodeString().BuildFromNum(ULLONG_MAX), "18446744073709551615");
}

// The conversion letter decides how the value is shown, whatever its type.
TEST(ZelUnicodeStringBuildFromNum, LetterThatDoesNotMatchTheType) {
    const double nan = std::numeric_limits<double>::quiet_NaN();
    const FormatCase cases[] = {
        {Build(3, "%g"), "3"},
        {Build(3, "%.2f"), "3.00"},
        {Build(LLONG_MAX, "%g"), "9.22337e+18"},
        {Build(ULLONG_MAX, "%d"), "-1"},
        {Build(1ULL << 63, "%I64d"), "-9223372036854775808"},
        {Build(-1, "%u"), "4294967295"},  // an integer keeps its own width
        {Build(-1, "%x"), "ffffffff"},
        {Build(-1, "%I64u"), "4294967295"},
        {Build(UINT_MAX, "%d"), "-1"},
        {Build(-1LL, "%u"), "18446744073709551615"},
        {Build(65, "%c"), "A"},
        {Build(2.75, "%d"), "2"},
        {Build(-2.75, "%d"), "-2"},
        {Build(1e300, "%d"), "9223372036854775807"},
        {Build(-1e300, "%I64d"), "-9223372036854775808"},
        {Build(1e300, "%I64u"), "18446744073709551615"},
        {Build(-3.5, "%x"), "fffffffffffffffd"},
        {Build(nan, "%d"), "0"},
        {Build(nan, "%u"), "0"},
        {Build(std::numeric_limits<double>::infinity(), "%c"), "\xFF"},
        {Build(65.9, "%c"), "A"},
    };
    for (const FormatCase& c : cases) EXPECT_EQ(c.built, c.expected);
}

// A format that cannot format one number must neither read a missing argument nor write through
// one: it falls back to the overload's default format.
TEST(ZelUnicodeStringBuildFromNum, UnusableFormatFallsBackToTheDefault) {
    const char* const formats[] = {
        "%s",      "%n",
        "%p",      "%*d",
        "%5*d",    "%.*f",
        "%d %d",   "%s%s%s%n",
        "",        "text",
        "%",       "abc%",
        "%I64",    "%l",
        "%1.2.3d", "%5-d",
        "%-05",    "%q",
        "%%",      "%10000d",
        "%.5000f", "%99999999999999999999d",
    };
    for (const char* format : formats) {
        EXPECT_EQ(Build(42, format), "42") << format;
        EXPECT_EQ(Build(42u, format), "42") << format;
        EXPECT_EQ(Build(0.5, format), "0.5") << format;
        EXPECT_EQ(Build(-42LL, format), "-42") << format;
        EXPECT_EQ(Build(42ULL, format), "42") << format;
    }
    EXPECT_EQ(Build(42, nullptr), "42");
    EXPECT_EQ(Build(0.5, nullptr), "0.5");
}

TEST(ZelUnicodeStringBuildFromNum, LargestAcceptedFieldIsHonoured) {
    EXPECT_EQ(Build(7, "%4096d").size(), 4096u);
    EXPECT_EQ(Build(1.0, "%.4096f").size(), 4098u);
}

struct LengthCase {
    std::string text;
    int chars;
};

TEST(ZelUnicodeStringLength, CharsCountCodePointsAndEachInvalidByte) {
    const LengthCase cases[] = {
        {"", 0},
        {"abc", 3},
        {"\xC2\x80", 1},          // U+0080, the first two-byte character
        {"\xC3\xA9", 1},          // e acute
        {"\xE2\x82\xAC", 1},      // euro sign
        {"\xED\x9F\xBF", 1},      // U+D7FF, just below the surrogates
        {"\xEF\xBF\xBF", 1},      // U+FFFF
        {"\xF0\x9F\x98\x80", 1},  // an emoji
        {"\xF4\x8F\xBF\xBF", 1},  // U+10FFFF, the last code point
        {"a\xE2\x82\xAC"
         "b",
         3},
        {std::string("a\0b", 3), 3},  // NUL is a character like any other
        {"\xFF", 1},
        {"\x80\x80", 2},  // continuation bytes without a lead
        {"\xC3", 1},      // truncated at the end
        {"\xC3"
         "A",
         2},  // lead followed by a non-continuation
        {"\xE2\x82"
         "A",
         3},
        {"\xF0\x9F\x98", 3},
        {"\xC0\x80", 2},          // overlong NUL
        {"\xC1\xBF", 2},          // overlong
        {"\xE0\x80\x80", 3},      // overlong
        {"\xE0\x9F\xBF", 3},      // overlong
        {"\xF0\x80\x80\x80", 4},  // overlong
        {"\xF0\x8F\xBF\xBF", 4},  // overlong
        {"\xED\xA0\x80", 3},      // high surrogate
        {"\xED\xBF\xBF", 3},      // low surrogate
        {"\xF4\x90\x80\x80", 4},  // above U+10FFFF
        {"\xF5\x80\x80\x80", 4},
        {"\xF8\x88\x80\x80\x80", 5},  // five-byte forms do not exist
        {"\xC3\xA9\xFF\xC3\xA9", 3},  // one bad byte between two good characters
    };
    for (const LengthCase& c : cases) {
        ZelUnicodeString text(c.text);
        EXPECT_EQ(text.GetLengthInChar(), c.chars) << ::testing::PrintToString(c.text);
        EXPECT_EQ(text.GetLengthInByte(), static_cast<int>(c.text.size()))
            << ::testing::PrintToString(c.text);
    }
}

struct OrderCase {
    const char* left;
    const char* right;
    bool less;
};

TEST(ZelUnicodeStringOrder, IsByteOrder) {
    const OrderCase cases[] = {
        {"a", "b", true},
        {"b", "a", false},
        {"a", "a", false},
        {"", "a", true},
        {"a", "", false},
        {"a", "ab", true},
        {"Z", "a", true},  // case-sensitive
        {"\x7F", "\x80", true},
        {"z", "\xC3\xA9", true},  // bytes compare unsigned: 0x7A < 0xC3
        {"\xC3\xA9", "z", false},
        {"\xE2\x82\xAC", "\xF0\x9F\x98\x80", true},  // U+20AC < U+1F600
        {"\xEF\xBF\xBF", "\xF0\x90\x80\x80", true},  // U+FFFF < U+10000
    };
    for (const OrderCase& c : cases) {
        EXPECT_EQ(ZelUnicodeString(c.left) < ZelUnicodeString(c.right), c.less)
            << ::testing::PrintToString(c.left) << " < " << ::testing::PrintToString(c.right);
    }
}

TEST(ZelUnicodeStringOrder, OrdersNameKeyedMaps) {
    std::map<ZelUnicodeString, int> names{
        {"beta", 2}, {"\xC3\xA9t\xC3\xA9", 4}, {"Alpha", 1}, {"alpha", 3}};
    std::vector<std::string> order;
    for (const auto& entry : names) order.push_back(entry.first.str());
    EXPECT_EQ(order, (std::vector<std::string>{"Alpha", "alpha", "beta", "\xC3\xA9t\xC3\xA9"}));
}

struct EqualCase {
    ZelUnicodeString text;
    const char* other;
    bool equal;
};

TEST(ZelUnicodeStringEquality, WithNarrowText) {
    const EqualCase cases[] = {
        {"abc", "abc", true},
        {"abc", "abd", false},
        {"abc", "ab", false},
        {"ab", "abc", false},
        {"abc", "ABC", false},
        {"", "", true},
        {"", nullptr, true},
        {"x", nullptr, false},
        {ZelUnicodeString("a\0b", 3), "a", false},  // the NUL and what follows count
        {ZelUnicodeString(nullptr, 3), "", true},
        {ZelUnicodeString(static_cast<const char*>(nullptr)), "", true},
    };
    for (const EqualCase& c : cases) {
        const char* shown = c.other != nullptr ? c.other : "(null)";
        EXPECT_EQ(c.text == c.other, c.equal) << c.text << " == " << shown;
        EXPECT_EQ(c.other == c.text, c.equal) << shown << " == " << c.text;
        EXPECT_EQ(c.text != c.other, !c.equal) << c.text << " != " << shown;
        EXPECT_EQ(c.other != c.text, !c.equal) << shown << " != " << c.text;
        if (c.other != nullptr) {
            EXPECT_EQ(c.text == ZelUnicodeString(c.other), c.equal);
            EXPECT_EQ(c.text != ZelUnicodeString(c.other), !c.equal);
        }
    }
}

TEST(ZelUnicodeStringConcatenation, AllFormsAgree) {
    const ZelUnicodeString left("Parameters::");
    const ZelUnicodeString right("ReadInt32()");
    EXPECT_EQ(left + right, "Parameters::ReadInt32()");
    EXPECT_EQ(left + "ReadInt32()", "Parameters::ReadInt32()");
    EXPECT_EQ("Parameters::" + right, "Parameters::ReadInt32()");
    EXPECT_EQ("<" + right + ">", "<ReadInt32()>");
    EXPECT_EQ(left, "Parameters::");  // + leaves its operands alone
    EXPECT_EQ(right, "ReadInt32()");

    ZelUnicodeString text("a");
    text += "b";
    text += ZelUnicodeString("c");
    text.Append("d").Append(ZelUnicodeString("e"));
    text.Append(nullptr);
    text += static_cast<const char*>(nullptr);
    EXPECT_EQ(text, "abcde");
    EXPECT_EQ(static_cast<const char*>(nullptr) + text, "abcde");
    EXPECT_EQ(text + static_cast<const char*>(nullptr), "abcde");

    ZelUnicodeString self("ab");
    self += self;
    EXPECT_EQ(self, "abab");
}

TEST(ZelUnicodeStringConversion, StreamsTheBytes) {
    std::ostringstream out;
    out << "[" << ZelUnicodeString(std::string("caf\xC3\xA9\0!", 7)) << "]";
    EXPECT_EQ(out.str(), std::string("[caf\xC3\xA9\0!]", 9));
}

TEST(ZelUnicodeStringHash, EqualTextsHashEqualAndServeAsKeys) {
    const std::hash<ZelUnicodeString> hash;
    ZelUnicodeString built("name");
    built += "d";
    EXPECT_EQ(hash(built), hash(ZelUnicodeString(std::string("named"))));

    std::unordered_set<ZelUnicodeString> names{"a", "b", "a", "\xC3\xA9", ""};
    EXPECT_EQ(names.size(), 4u);
    EXPECT_EQ(names.count(ZelUnicodeString("\xC3\xA9")), 1u);
    EXPECT_EQ(names.count(ZelUnicodeString("c")), 0u);

    std::unordered_map<ZelUnicodeString, int> counts;
    for (const char* word : {"x", "y", "x", "x"}) ++counts[word];
    EXPECT_EQ(counts["x"], 3);
    EXPECT_EQ(counts["y"], 1);
}

}  // namespace

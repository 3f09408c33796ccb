#include "ZelUnicodeString.h"

#include <cmath>
#include <cstdarg>
#include <cstdio>
#include <limits>
#include <ostream>
#include <type_traits>

namespace {

// One printf conversion taken apart: the text before it, its flags/width/precision, its
// conversion letter and the text after it.
struct Conversion {
    std::string prefix;
    std::string flags;  // flags, width and precision, without '%', length modifier or letter
    char letter = 0;
    std::string suffix;
};

bool IsLengthModifier(char c) {
    return c == 'h' || c == 'l' || c == 'L' || c == 'q' || c == 'j' || c == 'z' || c == 't';
}

// Widths and precisions above this make a format unusable: a number of that size would only
// serve to make one formatting allocate without bound.
constexpr int kMaxFieldSize = 4096;

// Reads the digits at `p` into `value` (clipped above kMaxFieldSize) and appends them to `flags`.
const char* ReadField(const char* p, std::string& flags, int& value) {
    value = 0;
    for (; *p >= '0' && *p <= '9'; ++p) {
        if (value <= kMaxFieldSize) value = value * 10 + (*p - '0');
        flags += *p;
    }
    return p;
}

// Finds the single conversion of `format`: "%" flags* width? ("." precision?)? length? letter,
// with "I64" accepted as a length. "%%" stays literal text. Returns false when there is no
// conversion, more than one, a '*' (which would read an argument we do not pass), or a width or
// precision above kMaxFieldSize.
bool ParseFormat(const char* format, Conversion& out) {
    std::string literal;
    bool found = false;
    for (const char* p = format; *p != '\0'; ++p) {
        if (*p != '%') {
            literal += *p;
            continue;
        }
        if (p[1] == '%') {
            literal += "%%";
            ++p;
            continue;
        }
        if (found) return false;
        found = true;
        out.prefix = literal;
        literal.clear();
        ++p;
        while (*p == '-' || *p == '+' || *p == ' ' || *p == '#' || *p == '0') out.flags += *p++;
        int width = 0;
        int precision = 0;
        p = ReadField(p, out.flags, width);
        if (*p == '.') {
            out.flags += *p++;
            p = ReadField(p, out.flags, precision);
        }
        if (width > kMaxFieldSize || precision > kMaxFieldSize) return false;
        if (p[0] == 'I' && p[1] == '6' && p[2] == '4') p += 3;
        while (IsLengthModifier(*p)) ++p;
        if (*p == '\0' || *p == '*') return false;
        out.letter = *p;
    }
    out.suffix = literal;
    return found;
}

// The integer that printf is given for a value of type T. An integer keeps its own width, as when
// printf is handed it directly: an int -1 shown unsigned is 4294967295, an unsigned int shown
// signed may be negative. A double truncates toward zero and saturates at the ends of the 64-bit
// range, NaN gives 0 (casting an out-of-range double to an integer would be undefined).
template <typename Integer, typename T>
Integer ToInteger(T value) {
    if constexpr (std::is_floating_point<T>::value) {
        if (std::isnan(value)) return 0;
        // 2^63 and 2^64 are exact in a double; comparisons against them are exact too.
        constexpr double kTwo63 = 9223372036854775808.0;
        if (std::is_signed<Integer>::value || value < 0) {
            if (value >= kTwo63) return static_cast<Integer>(std::numeric_limits<long long>::max());
            if (value < -kTwo63) return static_cast<Integer>(std::numeric_limits<long long>::min());
            return static_cast<Integer>(static_cast<long long>(value));
        }
        if (value >= 2.0 * kTwo63) return std::numeric_limits<Integer>::max();
        return static_cast<Integer>(value);
    } else if constexpr (std::is_signed<Integer>::value) {
        return static_cast<Integer>(static_cast<std::make_signed_t<T>>(value));
    } else {
        return static_cast<Integer>(static_cast<std::make_unsigned_t<T>>(value));
    }
}

std::string FormatV(const char* format, va_list args) {
    va_list again;
    va_copy(again, args);
    char small[64];
    int size = std::vsnprintf(small, sizeof small, format, args);
    std::string result;
    if (size < 0) {
        va_end(again);
        return result;
    }
    if (static_cast<std::size_t>(size) < sizeof small) {
        result.assign(small, static_cast<std::size_t>(size));
    } else {
        result.resize(static_cast<std::size_t>(size) + 1);
        std::vsnprintf(&result[0], result.size(), format, again);
        result.resize(static_cast<std::size_t>(size));
    }
    va_end(again);
    return result;
}

std::string Format(const char* format, ...) __attribute__((format(printf, 1, 2)));
std::string Format(const char* format, ...) {
    va_list args;
    va_start(args, format);
    std::string result = FormatV(format, args);
    va_end(args);
    return result;
}

// Formats a number with a caller's format. The conversion letter decides how the value is passed,
// whatever its C++ type, so a format that does not match the value (or asks for a string) can
// never make printf read the wrong argument.
template <typename T>
std::string FormatNumber(T value, const char* format, const char* fallback) {
    Conversion c;
    if (format == nullptr || !ParseFormat(format, c)) {
        c = Conversion();
        if (!ParseFormat(fallback, c)) return std::string();
    }
    std::string flags = c.prefix + "%" + c.flags;
    switch (c.letter) {
        case 'd':
        case 'i':
            return Format((flags + "lld" + c.suffix).c_str(), ToInteger<long long>(value));
        case 'u':
        case 'x':
        case 'X':
        case 'o':
            return Format((flags + "ll" + c.letter + c.suffix).c_str(),
                          ToInteger<unsigned long long>(value));
        case 'c':
            return Format((flags + "c" + c.suffix).c_str(),
                          static_cast<int>(ToInteger<long long>(value)));
        case 'f':
        case 'F':
        case 'e':
        case 'E':
        case 'g':
        case 'G':
        case 'a':
        case 'A':
            return Format((flags + c.letter + c.suffix).c_str(), static_cast<double>(value));
        default:
            // A letter that takes no number ("%s", "%n", "%p"...): use the default format.
            if (format != fallback) return FormatNumber(value, fallback, fallback);
            return std::string();
    }
}

}  // namespace

int ZelUnicodeString::SearchSubString(const ZelUnicodeString& text, int start, int mode) const {
    std::size_t found;
    if (mode == kBackward) {
        std::size_t from = (start < 0 || static_cast<std::size_t>(start) >= text_.size())
                               ? std::string::npos
                               : static_cast<std::size_t>(start);
        found = text_.rfind(text.text_, from);
    } else {
        if (start < 0) start = 0;
        if (static_cast<std::size_t>(start) > text_.size()) return -1;
        found = text_.find(text.text_, static_cast<std::size_t>(start));
    }
    return found == std::string::npos ? -1 : static_cast<int>(found);
}

ZelUnicodeString ZelUnicodeString::SubString(int start, int count) const {
    if (start < 0) start = 0;
    if (static_cast<std::size_t>(start) >= text_.size()) return ZelUnicodeString();
    std::size_t n = count < 0 ? std::string::npos : static_cast<std::size_t>(count);
    return ZelUnicodeString(text_.substr(static_cast<std::size_t>(start), n));
}

bool ZelUnicodeString::ReplaceSubString(const ZelUnicodeString& from, const ZelUnicodeString& to) {
    if (from.text_.empty()) return false;
    std::size_t at = text_.find(from.text_);
    if (at == std::string::npos) return false;
    text_.replace(at, from.text_.size(), to.text_);
    return true;
}

int ZelUnicodeString::ReplaceAll(const ZelUnicodeString& from, const ZelUnicodeString& to) {
    if (from.text_.empty()) return 0;
    int count = 0;
    std::string result;
    std::size_t done = 0;
    for (std::size_t at = text_.find(from.text_); at != std::string::npos;
         at = text_.find(from.text_, done)) {
        result.append(text_, done, at - done);
        result += to.text_;
        done = at + from.text_.size();
        ++count;
    }
    if (count == 0) return 0;
    result.append(text_, done, std::string::npos);
    text_.swap(result);
    return count;
}

ZelUnicodeString& ZelUnicodeString::BuildFromNum(int value, const char* format) {
    text_ = FormatNumber(value, format, "%d");
    return *this;
}

ZelUnicodeString& ZelUnicodeString::BuildFromNum(unsigned int value, const char* format) {
    text_ = FormatNumber(value, format, "%u");
    return *this;
}

ZelUnicodeString& ZelUnicodeString::BuildFromNum(double value, const char* format) {
    text_ = FormatNumber(value, format, "%g");
    return *this;
}

ZelUnicodeString& ZelUnicodeString::BuildFromNum(long long value, const char* format) {
    text_ = FormatNumber(value, format, "%I64d");
    return *this;
}

ZelUnicodeString& ZelUnicodeString::BuildFromNum(unsigned long long value, const char* format) {
    text_ = FormatNumber(value, format, "%I64u");
    return *this;
}

namespace {

// Length of the well-formed UTF-8 sequence at [p, end), or 0 when none starts there. Overlong
// forms, surrogates (U+D800..U+DFFF) and code points above U+10FFFF are not well formed.
std::size_t SequenceLength(const unsigned char* p, const unsigned char* end) {
    const unsigned char lead = *p;
    if (lead < 0x80) return 1;
    std::size_t length;
    unsigned char low = 0x80;  // bounds of the byte after the lead
    unsigned char high = 0xBF;
    if (lead >= 0xC2 && lead <= 0xDF) {
        length = 2;
    } else if (lead >= 0xE0 && lead <= 0xEF) {
        length = 3;
        if (lead == 0xE0) low = 0xA0;
        if (lead == 0xED) high = 0x9F;
    } else if (lead >= 0xF0 && lead <= 0xF4) {
        length = 4;
        if (lead == 0xF0) low = 0x90;
        if (lead == 0xF4) high = 0x8F;
    } else {
        return 0;
    }
    if (static_cast<std::size_t>(end - p) < length) return 0;
    if (p[1] < low || p[1] > high) return 0;
    for (std::size_t i = 2; i < length; ++i) {
        if ((p[i] & 0xC0) != 0x80) return 0;
    }
    return length;
}

}  // namespace

int ZelUnicodeString::GetLengthInChar() const {
    int count = 0;
    const auto* p = reinterpret_cast<const unsigned char*>(text_.data());
    const unsigned char* end = p + text_.size();
    while (p < end) {
        std::size_t length = SequenceLength(p, end);
        p += length == 0 ? 1 : length;
        ++count;
    }
    return count;
}

std::ostream& operator<<(std::ostream& out, const ZelUnicodeString& text) {
    return out << text.str();
}

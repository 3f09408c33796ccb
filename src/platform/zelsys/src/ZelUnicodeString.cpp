#include "ZelUnicodeString.h"

#include <cstdarg>
#include <cstdio>
#include <ostream>

namespace {

// One printf conversion taken apart: the text before it, its flags/width/precision, its
// conversion letter and the text after it.
struct Conversion {
    std::string prefix;
    std::string spec;  // flags, width and precision, without '%', length modifier or letter
    char letter = 0;
    std::string suffix;
};

bool IsLengthModifier(char c) {
    return c == 'h' || c == 'l' || c == 'L' || c == 'q' || c == 'j' || c == 'z' || c == 't';
}

// Finds the single conversion of `format`. "%%" stays literal text. Returns false when there is
// no conversion, more than one, or a '*' width (which would read an argument we do not pass).
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
        while (*p != '\0' && std::string("-+ #0123456789.").find(*p) != std::string::npos) {
            out.spec += *p++;
        }
        if (p[0] == 'I' && p[1] == '6' && p[2] == '4') p += 3;
        while (IsLengthModifier(*p)) ++p;
        if (*p == '\0' || *p == '*') return false;
        out.letter = *p;
    }
    out.suffix = literal;
    return found;
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
        if (format == nullptr || !ParseFormat(fallback, c)) return std::string();
    }
    std::string spec = c.prefix + "%" + c.spec;
    switch (c.letter) {
        case 'd':
        case 'i':
            return Format((spec + "lld" + c.suffix).c_str(), static_cast<long long>(value));
        case 'u':
        case 'x':
        case 'X':
        case 'o':
            return Format((spec + "ll" + c.letter + c.suffix).c_str(),
                          static_cast<unsigned long long>(value));
        case 'c':
            return Format((spec + "c" + c.suffix).c_str(), static_cast<int>(value));
        case 'f':
        case 'F':
        case 'e':
        case 'E':
        case 'g':
        case 'G':
        case 'a':
        case 'A':
            return Format((spec + c.letter + c.suffix).c_str(), static_cast<double>(value));
        default:
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

int ZelUnicodeString::GetLengthInChar() const {
    int count = 0;
    const auto* p = reinterpret_cast<const unsigned char*>(text_.data());
    const unsigned char* end = p + text_.size();
    while (p < end) {
        unsigned char lead = *p;
        std::size_t length = lead < 0x80 ? 1 : (lead >> 5) == 0x6 ? 2 : (lead >> 4) == 0xE ? 3
                                            : (lead >> 3) == 0x1E ? 4 : 1;
        if (length > static_cast<std::size_t>(end - p)) length = 1;
        for (std::size_t i = 1; i < length; ++i) {
            if ((p[i] & 0xC0) != 0x80) {
                length = 1;
                break;
            }
        }
        p += length;
        ++count;
    }
    return count;
}

std::ostream& operator<<(std::ostream& out, const ZelUnicodeString& text) {
    return out << text.str();
}

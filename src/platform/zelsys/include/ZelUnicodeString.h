// ZelUnicodeString: the string value type of every interface of the system library, the kernel and
// TarnCommandBinder.
//
// The text is UTF-8 held in a std::string. Positions and counts are in bytes; GetLengthInChar counts
// code points. Ordering (<) is byte order, which for valid UTF-8 is code-point order, and every
// comparison is exact and case-sensitive. A ZelUnicodeString is a value: copies are independent.
// Like std::string it is not safe to change one object from two threads at once.
#ifndef ZELSYS_ZELUNICODESTRING_H_
#define ZELSYS_ZELUNICODESTRING_H_

#include <cstddef>
#include <functional>
#include <iosfwd>
#include <string>
#include <utility>

class ZelUnicodeString {
public:
    // Search directions of SearchSubString.
    enum { kForward = 1, kBackward = 2 };

    ZelUnicodeString() = default;
    ZelUnicodeString(const char* text) : text_(text != nullptr ? text : "") {}  // NOLINT
    // `size` bytes at `text`, NUL bytes included; a null `text` gives the empty string.
    ZelUnicodeString(const char* text, std::size_t size)
        : text_(text != nullptr ? std::string(text, size) : std::string()) {}
    ZelUnicodeString(const std::string& text) : text_(text) {}  // NOLINT
    ZelUnicodeString(std::string&& text) noexcept : text_(std::move(text)) {}  // NOLINT

    ZelUnicodeString(const ZelUnicodeString&) = default;
    ZelUnicodeString(ZelUnicodeString&&) noexcept = default;
    ZelUnicodeString& operator=(const ZelUnicodeString&) = default;
    ZelUnicodeString& operator=(ZelUnicodeString&&) noexcept = default;

    bool operator==(const ZelUnicodeString& other) const { return text_ == other.text_; }
    bool operator!=(const ZelUnicodeString& other) const { return text_ != other.text_; }
    bool operator==(const char* other) const { return text_ == (other != nullptr ? other : ""); }
    bool operator!=(const char* other) const { return !(*this == other); }
    bool operator<(const ZelUnicodeString& other) const { return text_ < other.text_; }

    ZelUnicodeString operator+(const ZelUnicodeString& other) const { return text_ + other.text_; }
    ZelUnicodeString operator+(const char* other) const {
        return ZelUnicodeString(*this).Append(other);
    }
    ZelUnicodeString& operator+=(const ZelUnicodeString& other) { return Append(other); }
    ZelUnicodeString& operator+=(const char* other) { return Append(other); }
    ZelUnicodeString& Append(const ZelUnicodeString& other) {
        text_ += other.text_;
        return *this;
    }
    ZelUnicodeString& Append(const char* other) {
        if (other != nullptr) text_ += other;
        return *this;
    }

    // Byte position of `text`, or -1 when absent. kForward finds the first occurrence at or after
    // `start`; kBackward the last one that begins at or before `start` (a negative `start`, or one
    // past the end, searches from the end). An empty `text` is found at the start position.
    int SearchSubString(const ZelUnicodeString& text, int start = 0, int mode = kForward) const;

    // `count` bytes from `start` (fewer at the end of the text; a negative count takes the rest).
    // A start past the end gives the empty text.
    ZelUnicodeString SubString(int start, int count = -1) const;

    // Replaces the first occurrence of `from` by `to`; true when one was found.
    bool ReplaceSubString(const ZelUnicodeString& from, const ZelUnicodeString& to);
    // Replaces every occurrence, scanning left to right, never rescanning replaced text. Returns
    // the number of replacements; an empty `from` replaces nothing.
    int ReplaceAll(const ZelUnicodeString& from, const ZelUnicodeString& to);

    // Replaces the text by `value` formatted with the printf-style `format`. The spellings "%I64d"
    // and "%I64u" (and "%I64x", "%I64X") stand for 64-bit integers. The conversion letter decides
    // how the value is shown, whatever its type: a double shown with "%d" is truncated toward zero
    // (saturating, NaN as 0), an integer shown with "%g" is widened, and an integer keeps its own
    // width as printf would show it (an int -1 with "%u" is 4294967295). A format that cannot
    // format one number (null, no conversion or several, "%s", "%n", "*", a width or precision
    // above 4096) is replaced by the default format of the overload. Returns *this.
    ZelUnicodeString& BuildFromNum(int value, const char* format = "%d");
    ZelUnicodeString& BuildFromNum(unsigned int value, const char* format = "%u");
    ZelUnicodeString& BuildFromNum(double value, const char* format = "%g");
    ZelUnicodeString& BuildFromNum(long long value, const char* format = "%I64d");
    ZelUnicodeString& BuildFromNum(unsigned long long value, const char* format = "%I64u");

    // Narrow text, valid while the string is not changed.
    const char* ConvertToChar() const { return text_.c_str(); }
    const char* c_str() const { return text_.c_str(); }
    const std::string& str() const { return text_; }
    explicit operator std::string() const { return text_; }

    int GetLengthInByte() const { return static_cast<int>(text_.size()); }
    // Number of code points; a byte that does not start a valid sequence counts as one.
    int GetLengthInChar() const;
    bool IsEmpty() const { return text_.empty(); }

private:
    std::string text_;
};

inline ZelUnicodeString operator+(const char* left, const ZelUnicodeString& right) {
    return ZelUnicodeString(left) + right;
}
inline bool operator==(const char* left, const ZelUnicodeString& right) { return right == left; }
inline bool operator!=(const char* left, const ZelUnicodeString& right) { return right != left; }

std::ostream& operator<<(std::ostream& out, const ZelUnicodeString& text);

namespace std {
template <>
struct hash<ZelUnicodeString> {
    size_t operator()(const ZelUnicodeString& text) const noexcept {
        return hash<string>()(text.str());
    }
};
}  // namespace std

#endif  // ZELSYS_ZELUNICODESTRING_H_

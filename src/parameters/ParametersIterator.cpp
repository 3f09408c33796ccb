#include "Tarn/ParametersIterator.h"

#include <cmath>
#include <stdexcept>
#include <tuple>

#include "parameters/ParametersImpl.h"

namespace Tarn {
namespace {

template <ValueKind K>
using Cursor = typename Table<typename KindTable<K>::Value>::const_iterator;

template <typename Seq>
struct CursorsOf;
template <int... I>
struct CursorsOf<std::integer_sequence<int, I...>> {
    using Type = std::tuple<Cursor<static_cast<ValueKind>(I + 1)>...>;
};
using Cursors = CursorsOf<std::make_integer_sequence<int, kKindCount>>::Type;

// Calls f(std::integral_constant<ValueKind, K>) for the kind K numbered `kind` (1 to 27).
template <typename F, int... I>
void VisitKindImpl(int kind, F& f, std::integer_sequence<int, I...>) {
    (void)((kind == I + 1 ? (f(std::integral_constant<ValueKind, static_cast<ValueKind>(I + 1)>{}),
                             true)
                          : false) ||
           ...);
}
template <typename F>
void VisitKind(int kind, F&& f) {
    VisitKindImpl(kind, f, std::make_integer_sequence<int, kKindCount>{});
}

// JSON string contents: quote, backslash and control characters escaped.
void AppendEscaped(std::string& out, const std::string& text) {
    static const char kHex[] = "0123456789abcdef";
    for (char c : text) {
        switch (c) {
            case '"': out += "\\\""; break;
            case '\\': out += "\\\\"; break;
            case '\b': out += "\\b"; break;
            case '\f': out += "\\f"; break;
            case '\n': out += "\\n"; break;
            case '\r': out += "\\r"; break;
            case '\t': out += "\\t"; break;
            default:
                if (static_cast<unsigned char>(c) < 0x20) {
                    out += "\\u00";
                    out += kHex[(c >> 4) & 0xF];
                    out += kHex[c & 0xF];
                } else {
                    out += c;
                }
        }
    }
}

void AppendQuoted(std::string& out, const ZelUnicodeString& text) {
    out += '"';
    AppendEscaped(out, text.str());
    out += '"';
}

void AppendNumber(std::string& out, bool v) { out += v ? '1' : '0'; }
void AppendNumber(std::string& out, signed char v) {
    out += ZelUnicodeString().BuildFromNum(static_cast<int>(v), "%d").str();
}
void AppendNumber(std::string& out, short v) {
    out += ZelUnicodeString().BuildFromNum(static_cast<int>(v), "%d").str();
}
void AppendNumber(std::string& out, int v) { out += ZelUnicodeString().BuildFromNum(v, "%d").str(); }
void AppendNumber(std::string& out, unsigned char v) {
    out += ZelUnicodeString().BuildFromNum(static_cast<unsigned int>(v), "%u").str();
}
void AppendNumber(std::string& out, unsigned short v) {
    out += ZelUnicodeString().BuildFromNum(static_cast<unsigned int>(v), "%u").str();
}
void AppendNumber(std::string& out, unsigned int v) {
    out += ZelUnicodeString().BuildFromNum(v, "%u").str();
}
void AppendNumber(std::string& out, long long v) {
    out += ZelUnicodeString().BuildFromNum(v, "%I64d").str();
}
void AppendNumber(std::string& out, unsigned long long v) {
    out += ZelUnicodeString().BuildFromNum(v, "%I64u").str();
}
// JSON has no infinity or NaN; they render as null.
void AppendNumber(std::string& out, double v) {
    if (!std::isfinite(v)) {
        out += "null";
        return;
    }
    out += ZelUnicodeString().BuildFromNum(v, "%g").str();
}
void AppendNumber(std::string& out, float v) { AppendNumber(out, static_cast<double>(v)); }

void AppendJson(std::string& out, const Parameters& bag) {
    ZelUnicodeString text;
    bag.ToJSON(text);
    out += text.str();
}

}  // namespace

struct ParametersIteratorState {
    const ParametersImpl* store;
    int kind = 0;
    ZelUnicodeString name;
    ZelUnicodeString type;
    Cursors cursors;

    template <ValueKind K>
    Cursor<K>& CursorOf() {
        return std::get<static_cast<int>(K) - 1>(cursors);
    }
    template <ValueKind K>
    const Cursor<K>& CursorOf() const {
        return std::get<static_cast<int>(K) - 1>(cursors);
    }
    template <ValueKind K>
    bool AtTableEnd() const {
        return CursorOf<K>() == KindTable<K>::Get(*store).end();
    }

    // Takes name and type from the entry under the cursor of the current kind.
    template <ValueKind K>
    void TakeEntry() {
        const auto& entry = *CursorOf<K>();
        name = entry.first;
        if constexpr (K == ValueKind::Object) {
            type = entry.second->GetObjectType().IsEmpty() ? ZelUnicodeString("object")
                                                           : entry.second->GetObjectType();
        } else if constexpr (K == ValueKind::ObjectArray) {
            ZelUnicodeString element;
            store->GetObjectArrayElementType(entry.first, element);
            type = element + "[]";
        } else {
            type = KindName(K);
        }
    }

    // Stands on the first entry of the first non-empty table from kind `from` on.
    void SeekFrom(int from) {
        for (int k = from; k <= kKindCount; ++k) {
            bool found = false;
            VisitKind(k, [&](auto kind) {
                constexpr ValueKind K = decltype(kind)::value;
                CursorOf<K>() = KindTable<K>::Get(*store).begin();
                if (!AtTableEnd<K>()) {
                    TakeEntry<K>();
                    found = true;
                }
            });
            if (found) {
                kind = k;
                return;
            }
        }
        kind = 0;
    }

    void Advance() {
        if (kind < 1 || kind > kKindCount) {
            kind = 0;
            return;
        }
        bool stays = false;
        VisitKind(kind, [&](auto k) {
            constexpr ValueKind K = decltype(k)::value;
            if (AtTableEnd<K>()) return;
            ++CursorOf<K>();
            if (!AtTableEnd<K>()) {
                TakeEntry<K>();
                stays = true;
            }
        });
        if (!stays) SeekFrom(kind + 1);
    }

    bool OnEntry(ValueKind wanted) const {
        if (kind != static_cast<int>(wanted)) return false;
        bool on = false;
        VisitKind(kind, [&](auto k) { on = !AtTableEnd<decltype(k)::value>(); });
        return on;
    }

    void RenderValue(std::string& out) const {
        VisitKind(kind, [&](auto k) {
            constexpr ValueKind K = decltype(k)::value;
            if (AtTableEnd<K>()) return;
            const auto& value = CursorOf<K>()->second;
            if constexpr (K == ValueKind::String) {
                AppendQuoted(out, value);
            } else if constexpr (K == ValueKind::Buffer) {
                out += "\"buffer(";
                out += ZelUnicodeString().BuildFromNum(value.GetSize(), "%u").str();
                out += ")\"";
            } else if constexpr (K == ValueKind::Object) {
                AppendJson(out, *value);
            } else if constexpr (K == ValueKind::ObjectArray) {
                out += '[';
                bool first = true;
                for (const Parameters* element : value.elements) {
                    if (!first) out += ',';
                    first = false;
                    if (element != nullptr) AppendJson(out, *element);
                }
                out += ']';
            } else if constexpr (K == ValueKind::StringArray) {
                out += '[';
                for (std::size_t i = 0; i < value.size(); ++i) {
                    if (i != 0) out += ',';
                    AppendQuoted(out, value[i]);
                }
                out += ']';
            } else if constexpr (IsNumericArrayKind(K) || K == ValueKind::BoolArray) {
                out += '[';
                for (std::size_t i = 0; i < value.size(); ++i) {
                    if (i != 0) out += ',';
                    AppendNumber(out, static_cast<typename std::decay_t<decltype(value)>::value_type>(
                                          value[i]));
                }
                out += ']';
            } else {
                AppendNumber(out, value);
            }
        });
    }
};

ParametersIterator::ParametersIterator(const ParametersImpl& store, EMode mode)
    : state_(new ParametersIteratorState()) {
    state_->store = &store;
    if (mode == AtBegin) {
        state_->SeekFrom(1);
    } else {
        // Cursors of an end iterator stand at their tables' ends.
        store.ForEachTable([this](auto k, const auto& table) {
            state_->CursorOf<decltype(k)::value>() = table.end();
        });
    }
}

ParametersIterator::ParametersIterator(const ParametersIterator& other)
    : state_(new ParametersIteratorState(*other.state_)) {}

ParametersIterator& ParametersIterator::operator=(const ParametersIterator& other) {
    if (this != &other) *state_ = *other.state_;
    return *this;
}

ParametersIterator::~ParametersIterator() { delete state_; }

bool ParametersIterator::operator==(const ParametersIterator& other) const {
    if (state_->store != other.state_->store) return false;
    if (state_->kind == 0 || other.state_->kind == 0) {
        return state_->kind == other.state_->kind;
    }
    if (state_->kind != other.state_->kind) return false;
    bool same = false;
    VisitKind(state_->kind, [&](auto k) {
        constexpr ValueKind K = decltype(k)::value;
        same = state_->CursorOf<K>() == other.state_->CursorOf<K>();
    });
    return same;
}

ParametersIterator& ParametersIterator::operator++() {
    state_->Advance();
    return *this;
}

ParametersIterator ParametersIterator::operator++(int) {
    ParametersIterator before(*this);
    state_->Advance();
    return before;
}

const ZelUnicodeString& ParametersIterator::GetName() const { return state_->name; }

const ZelUnicodeString& ParametersIterator::GetType() const { return state_->type; }

long ParametersIterator::GetStringValue(ZelUnicodeString& value) const {
    std::string text;
    if (state_->kind != 0) state_->RenderValue(text);
    value = std::move(text);
    return 0;
}

bool ParametersIterator::IsObject() const { return state_->OnEntry(ValueKind::Object); }

bool ParametersIterator::IsObjectArray() const { return state_->OnEntry(ValueKind::ObjectArray); }

unsigned int ParametersIterator::GetObjectArraySize() const {
    if (!IsObjectArray()) return 0;
    return static_cast<unsigned int>(
        state_->CursorOf<ValueKind::ObjectArray>()->second.elements.size());
}

ParametersIterator ParametersIterator::ObjectBegin() const {
    if (!IsObject()) return ParametersIterator(*state_->store, AtEnd);
    return state_->CursorOf<ValueKind::Object>()->second->Begin();
}

ParametersIterator ParametersIterator::ObjectEnd() const {
    if (!IsObject()) return ParametersIterator(*state_->store, AtEnd);
    return state_->CursorOf<ValueKind::Object>()->second->End();
}

ParametersIterator ParametersIterator::ObjectArrayBegin(unsigned int index) const {
    if (!IsObjectArray()) return ParametersIterator(*state_->store, AtEnd);
    const Parameters* element =
        state_->CursorOf<ValueKind::ObjectArray>()->second.elements.at(index);
    if (element == nullptr) return ParametersIterator(*state_->store, AtEnd);
    return element->Begin();
}

ParametersIterator ParametersIterator::ObjectArrayEnd(unsigned int index) const {
    if (!IsObjectArray()) return ParametersIterator(*state_->store, AtEnd);
    const Parameters* element =
        state_->CursorOf<ValueKind::ObjectArray>()->second.elements.at(index);
    if (element == nullptr) return ParametersIterator(*state_->store, AtEnd);
    return element->End();
}

ParametersIterator Parameters::Begin() const {
    return ParametersIterator(*impl_, ParametersIterator::AtBegin);
}

ParametersIterator Parameters::End() const {
    return ParametersIterator(*impl_, ParametersIterator::AtEnd);
}

long Parameters::ToJSON(ZelUnicodeString& text) const {
    std::string out = "{";
    bool first = true;
    ZelUnicodeString value;
    for (ParametersIterator it = Begin(), end = End(); it != end; ++it) {
        if (!first) out += ',';
        first = false;
        AppendQuoted(out, it.GetName());
        out += ":{\"type\":";
        AppendQuoted(out, it.GetType());
        out += ",\"value\":";
        it.GetStringValue(value);
        out += value.str();
        out += '}';
    }
    out += '}';
    text = std::move(out);
    return 0;
}

}  // namespace Tarn

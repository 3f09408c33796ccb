// Whole-bag operations: the deep copy.
#include "Tarn/TypesImpl.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {

// A copy holds what the binary form carries: every property and the object type, not the defaults
// link. It copies the tables directly instead of encoding and decoding, which gives the same bag
// far faster. Buffers share their immutable bytes.
Parameters::Parameters(const Parameters& other)
    : impl_(new ParametersImpl(*other.impl_->types, other.impl_->objectType)) {
    ParametersImpl::CopyTables(*other.impl_, *impl_);
}

void ParametersImpl::CopyFrom(const ParametersImpl& source) {
    if (&source == this) return;
    // Copy aside first: `source` may be a bag nested in this one, which clearing would destroy.
    ParametersImpl copy(*types, source.objectType);
    CopyTables(source, copy);
    SwapContents(copy);
}

void ParametersImpl::SwapContents(ParametersImpl& other) {
    ForEachTable([&other](auto k, auto& table) {
        table.swap(KindTable<decltype(k)::value>::Get(other));
    });
    elementTypes.swap(other.elementTypes);
    std::swap(objectType, other.objectType);
}

void ParametersImpl::CopyTables(const ParametersImpl& source, ParametersImpl& target) {
    target.ForEachTable([&source](auto k, auto& table) {
        constexpr ValueKind kind = decltype(k)::value;
        const auto& from = KindTable<kind>::Get(source);
        if constexpr (kind == ValueKind::Object) {
            for (const auto& entry : from) {
                table.emplace_hint(table.end(), entry.first,
                                   std::make_unique<Parameters>(*entry.second));
            }
        } else if constexpr (kind == ValueKind::ObjectArray) {
            for (const auto& entry : from) {
                ObjectArray& copy = table[entry.first];
                copy.elements.reserve(entry.second.elements.size());
                for (const Parameters* element : entry.second.elements) {
                    // An empty slot carries nothing across.
                    if (element != nullptr) copy.elements.push_back(new Parameters(*element));
                }
            }
        } else {
            table = from;
        }
    });
    // The element type is carried only for empty object arrays.
    for (const auto& record : source.elementTypes) {
        auto array = target.objectArrays.find(record.first);
        if (array != target.objectArrays.end() && array->second.elements.empty()) {
            target.elementTypes.insert(record);
        }
    }
}

}  // namespace Tarn

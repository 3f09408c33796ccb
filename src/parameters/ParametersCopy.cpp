// Whole-bag operations: the deep copy.
#include "Tarn/TypesImpl.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {

// A copy holds what the binary form carries: every property and the object type, not the defaults
// link. It copies the tables directly instead of encoding and decoding, which gives the same bag
// far faster. Buffers share their immutable bytes.
Parameters::Parameters(const Parameters& other)
    : impl_(new ParametersImpl(*other.impl_->types, other.impl_->objectType)) {
    const ParametersImpl& source = *other.impl_;
    ParametersImpl& target = *impl_;
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

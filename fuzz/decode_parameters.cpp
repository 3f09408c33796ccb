// Decodes arbitrary bytes into a bag, then encodes, renders and walks whatever came back.
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>

#include "Nimbo/Context.h"
#include "Nimbo/PrivateServices.h"
#include "Tarn/Parameters.h"
#include "Tarn/ParametersIterator.h"
#include "Tarn/Types.h"

namespace {

void Walk(Tarn::ParametersIterator it, const Tarn::ParametersIterator& end, int depth) {
    ZelUnicodeString value;
    for (; it != end; ++it) {
        it.GetStringValue(value);
        if (it.IsObject()) Walk(it.ObjectBegin(), it.ObjectEnd(), depth + 1);
        for (unsigned int i = 0; i < it.GetObjectArraySize(); ++i) {
            Walk(it.ObjectArrayBegin(i), it.ObjectArrayEnd(i), depth + 1);
        }
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static Nimbo::Context context;
    static Tarn::Types types(context);
    static bool quiet = [] {
        Nimbo::PrivateServices::SetErrorListener([](const ZelUnicodeString&, const ZelUnicodeString&) {});
        return true;
    }();
    (void)quiet;

    char* copy = new char[size > 0 ? size : 1];
    if (size > 0) std::memcpy(copy, data, size);
    Nimbo::Binary bytes(copy, static_cast<unsigned int>(size), Nimbo::deallocateArrayChar);

    Tarn::Parameters decoded(types, bytes);
    Nimbo::Binary encoded = decoded.ToBinary();
    // What decoded once must decode again to the same bytes.
    Tarn::Parameters again(types, encoded);
    if (!(again.ToBinary() == encoded)) std::abort();
    ZelUnicodeString json;
    decoded.ToJSON(json);
    Walk(decoded.Begin(), decoded.End(), 0);
    Tarn::Parameters copied(decoded);
    return 0;
}

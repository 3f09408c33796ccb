#include "declarations/DefaultCompatibility.h"

#include <algorithm>

#include "Tarn/ParametersIterator.h"
#include "Tarn/TypesImpl.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {

long ReportDefaultIncompatibility(const ZelUnicodeString& commandName, Parameters& defaults,
                                  Parameters& received, const TypesImpl& types) {
    std::vector<std::pair<ZelUnicodeString, ZelUnicodeString>> unknown;
    std::vector<std::pair<ZelUnicodeString, std::pair<ZelUnicodeString, ZelUnicodeString>>> wrong;
    ParametersImpl& impl = ParametersInternal::Impl(received);
    if (impl.CompareWithDefaults(defaults, unknown, wrong) >= 0) {
        impl.SetDefaults(&defaults);
        return S_OK;
    }
    ZelUnicodeString text =
        "\n--------------------Tarn Parameters ERROR--------------------\nCommand \"" +
        commandName +
        "\" called with parameters incompatible with command's default parameters\n"
        "Command's callback will not be called\n";
    if (!unknown.empty()) {
        text += "Expected Properties =\n";
        for (ParametersIterator it = defaults.Begin(), end = defaults.End(); it != end; ++it) {
            text += "  Expected Property = < " + it.GetName() + " (" + it.GetType() + ") >\n";
        }
        text += "Received Properties =\n";
        for (ParametersIterator it = received.Begin(), end = received.End(); it != end; ++it) {
            text += "  Received Property < " + it.GetName() + " (" + it.GetType() + ") > ";
            bool isUnknown = std::any_of(unknown.begin(), unknown.end(), [&](const auto& entry) {
                return entry.first == it.GetName();
            });
            if (isUnknown) text += "Unknown Property";
            text += "\n";
        }
        text += "\n";
    }
    if (!wrong.empty()) {
        text += "Incorrect typed Properties =\n";
        for (const auto& entry : wrong) {
            text += "  Received Property < " + entry.first + " (" + entry.second.first +
                    ") > Expected Type (" + entry.second.second + ") \n";
        }
    }
    types.PublishError(text);
    return E_FAIL;
}

}  // namespace Tarn

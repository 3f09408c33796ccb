#include "protocol/ProtocolMessage.h"

#include <cstdio>
#include <mutex>
#include <random>

#include "Nimbo/ResultCodes.h"
#include "Tarn/TypesImpl.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {
namespace Protocol {

const ZelUnicodeString kProtocol = "protocol";
const ZelUnicodeString kCommand = "command";
const ZelUnicodeString kVersionName = "version";
const ZelUnicodeString kGuid = "guid";
const ZelUnicodeString kBegin = "beginParameters";
const ZelUnicodeString kSend = "sendParameters";
const ZelUnicodeString kEnd = "endParameters";
const ZelUnicodeString kParams = "Params";
const ZelUnicodeString kDomainNames = "domainNames";
const ZelUnicodeString kDomains = "domains";
const ZelUnicodeString kRevoke = "revoke";
const ZelUnicodeString kEmit = "emit";
const ZelUnicodeString kDisconnect = "disconnect";

Phase ReadPhase(Parameters& message, const ZelUnicodeString& name) {
    ParametersImpl& impl = ParametersInternal::Impl(message);
    Phase phase;
    if (Parameters* nested = impl.FindObject(name)) {
        phase.marker = kPhase;
        phase.parameters = nested;
        return phase;
    }
    auto marker = impl.uint8s.find(name);
    if (marker != impl.uint8s.end()) phase.marker = marker->second;
    return phase;
}

long WritePhase(Parameters& message, const ZelUnicodeString& name, const Parameters& p) {
    if (p.IsEmpty()) return message.WriteUint8(name, kPhase);
    ParametersImpl& impl = ParametersInternal::Impl(message);
    Parameters* nested = impl.GetOrCreateObject(name);
    ParametersInternal::Impl(*nested).CopyFrom(ParametersInternal::Impl(p));
    return S_OK;
}

void RemovePhase(Parameters& message, const ZelUnicodeString& name) {
    ParametersImpl& impl = ParametersInternal::Impl(message);
    impl.RemoveObject(name);
    impl.RemoveUint8(name);
}

bool CheckVersion(const Parameters& message, const TypesImpl& types) {
    if (message.IsEmpty()) return false;
    const ParametersImpl& impl = ParametersInternal::Impl(message);
    auto found = impl.uint8s.find(kProtocol);
    unsigned char version = found != impl.uint8s.end() ? found->second : 0;
    if (version == kVersion) return true;
    types.PublishError("Tarn : Invalid communication Protocol.\nReceiver version = 1"
                       "\nSender version = " +
                       ZelUnicodeString().BuildFromNum(static_cast<int>(version), "%d"));
    return false;
}

Kind Classify(const Parameters& message, ZelUnicodeString& emitName) {
    const ParametersImpl& impl = ParametersInternal::Impl(message);
    if (impl.int8s.count(kDisconnect) != 0) return Kind::Disconnect;
    auto emit = impl.strings.find(kEmit);
    if (emit != impl.strings.end()) {
        emitName = emit->second;
        return Kind::Emission;
    }
    return Kind::RequestOrAnswer;
}

ZelUnicodeString MakeGuid() {
    // Draws of 0 to 32767, as rand() gives on the platforms the format comes from.
    static std::mutex lock;
    static std::mt19937 generator{std::random_device{}()};
    unsigned int d[12];
    {
        std::lock_guard<std::mutex> hold(lock);
        std::uniform_int_distribution<unsigned int> draw(0, 32767);
        for (unsigned int& v : d) v = draw(generator);
    }
    char text[48];
    std::snprintf(text, sizeof text, "{%08x-%04x-%04x-%02x%02x-%02x%02x%02x%02x%02x%02x}",
                  (d[0] << 16) + d[1], d[2], d[3], d[4] & 0xFF, d[5] & 0xFF, d[6] & 0xFF,
                  d[7] & 0xFF, d[8] & 0xFF, d[9] & 0xFF, d[10] & 0xFF, d[11] & 0xFF);
    return ZelUnicodeString(text);
}

}  // namespace Protocol
}  // namespace Tarn

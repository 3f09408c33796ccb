#include "Tarn/Message.h"

#include "Nimbo/ResultCodes.h"
#include "Tarn/Commands.h"
#include "Tarn/Types.h"
#include "hosting/CommandsImpl.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {

Message::Message(const Commands& commands) : domains_(CommandsInternal::GetTypes(commands)) {}

Message::Message(const Message& other) : domains_(other.domains_) {}

Message::~Message() {
    for (Parameters* p : extra_) delete p;
}

long Message::AnswerDomain(const ZelUnicodeString& name, const Parameters& p) {
    return domains_.WriteObject(name, "Parameters", &p);
}

long Message::GetDomainNames(std::vector<ZelUnicodeString>& names) const {
    for (const auto& domain : ParametersInternal::Impl(domains_).objects) {
        names.push_back(domain.first);
    }
    return names.empty() ? E_FAIL : S_OK;
}

}  // namespace Tarn

// Tarn::Response: the callbacks that receive answers and events, one per domain name.
//
// A callback is registered under a domain name in the first table (AddCallback) or in the second
// (AddFallbackCallback), which is consulted only when the first has no callback of that name. A
// callback is a plain function, a Nimbo::FunctionArgs1, or any callable taking
// `const Parameters&` and returning long. Copies are independent; a Response that a request or a
// subscription holds is a copy, so later changes to the original do not reach it.
#ifndef TARN_RESPONSE_H_
#define TARN_RESPONSE_H_

#include <map>
#include <utility>

#include "Nimbo/FunctionArgs1.h"
#include "Tarn/Export.h"
#include "ZelUnicodeString.h"

namespace Tarn {

class Parameters;

class TARN_EXPORT Response {
public:
    using Callback = Nimbo::FunctionArgs1<long, const Parameters&>;

    Response();
    Response(const Response& other);
    Response& operator=(const Response& other);
    ~Response();

    template <typename F>
    void AddCallback(const ZelUnicodeString& domain, F callback) {
        first_.insert_or_assign(domain, Callback(std::move(callback)));
    }
    template <typename F>
    void AddFallbackCallback(const ZelUnicodeString& domain, F callback) {
        second_.insert_or_assign(domain, Callback(std::move(callback)));
    }

    // Calls, in the order of m's "domainNames", the callback of each domain that has one and a
    // nested bag in m's "domains". 0 when every call succeeded.
    long CallDomains(const Parameters& m) const;
    bool HasDomain(const ZelUnicodeString& name) const;

private:
    friend class ResponseInternal;
    long CallDomain(const ZelUnicodeString& name, Parameters& p) const;
    unsigned GetDomainCount() const;

    std::map<ZelUnicodeString, Callback> first_;
    std::map<ZelUnicodeString, Callback> second_;
};

}  // namespace Tarn

#endif  // TARN_RESPONSE_H_

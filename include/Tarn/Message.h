// Tarn::Message: an answer or an event made of named domains, each a Parameters.
#ifndef TARN_MESSAGE_H_
#define TARN_MESSAGE_H_

#include <vector>

#include "Tarn/Export.h"
#include "Tarn/Parameters.h"
#include "ZelUnicodeString.h"

namespace Tarn {

class Commands;

class TARN_EXPORT Message {
public:
    explicit Message(const Commands& commands);
    Message(const Message& other);
    ~Message();
    Message& operator=(const Message&) = delete;

    // Sets the domain `name` to a copy of `p`, replacing an earlier one.
    long AnswerDomain(const ZelUnicodeString& name, const Parameters& p);
    // Appends the domain names in ascending order; fails when `names` is still empty.
    long GetDomainNames(std::vector<ZelUnicodeString>& names) const;
    const Parameters& GetDomains() const { return domains_; }

private:
    Parameters domains_;
    std::vector<Parameters*> extra_;
};

}  // namespace Tarn

#endif  // TARN_MESSAGE_H_

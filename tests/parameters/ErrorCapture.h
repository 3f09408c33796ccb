// ErrorCapture: records every error the kernel publishes while it lives.
//
// It replaces the process-wide error listener on construction and restores the default on
// destruction, so at most one should live at a time. The listener may be called from any thread;
// the record is guarded.
#ifndef TARN_TESTS_PARAMETERS_ERRORCAPTURE_H_
#define TARN_TESTS_PARAMETERS_ERRORCAPTURE_H_

#include <mutex>
#include <ostream>
#include <string>
#include <vector>

#include "Nimbo/PrivateServices.h"

namespace Tarn {
namespace Testing {

struct PublishedError {
    std::string message;
    std::string source;

    bool operator==(const PublishedError& other) const {
        return message == other.message && source == other.source;
    }
};

inline std::ostream& operator<<(std::ostream& out, const PublishedError& error) {
    return out << "{\"" << error.message << "\" from \"" << error.source << "\"}";
}

class ErrorCapture {
public:
    ErrorCapture() {
        Nimbo::PrivateServices::SetErrorListener(
            [this](const ZelUnicodeString& message, const ZelUnicodeString& source) {
                std::lock_guard<std::mutex> hold(lock_);
                errors_.push_back({message.str(), source.str()});
            });
    }
    ~ErrorCapture() { Nimbo::PrivateServices::SetErrorListener(nullptr); }
    ErrorCapture(const ErrorCapture&) = delete;
    ErrorCapture& operator=(const ErrorCapture&) = delete;

    std::vector<PublishedError> Errors() const {
        std::lock_guard<std::mutex> hold(lock_);
        return errors_;
    }
    std::vector<std::string> Messages() const {
        std::vector<std::string> messages;
        for (const PublishedError& error : Errors()) messages.push_back(error.message);
        return messages;
    }
    void Clear() {
        std::lock_guard<std::mutex> hold(lock_);
        errors_.clear();
    }

private:
    mutable std::mutex lock_;
    std::vector<PublishedError> errors_;
};

}  // namespace Testing
}  // namespace Tarn

#endif  // TARN_TESTS_PARAMETERS_ERRORCAPTURE_H_

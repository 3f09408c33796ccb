// MonitorCapture: records every monitor line the kernel receives while it lives.
//
// It replaces the process-wide monitor listener on construction and restores the default on
// destruction, so at most one should live at a time. Lines arrive from the nodes' delivery
// threads; the record is guarded.
#ifndef TARN_TESTS_PROTOCOL_MONITORCAPTURE_H_
#define TARN_TESTS_PROTOCOL_MONITORCAPTURE_H_

#include <mutex>
#include <ostream>
#include <string>
#include <vector>

#include "Nimbo/PrivateServices.h"

namespace Tarn {
namespace Testing {

struct MonitorLine {
    std::string node;
    std::string text;
    long code;

    bool operator==(const MonitorLine& other) const {
        return node == other.node && text == other.text && code == other.code;
    }
};

inline std::ostream& operator<<(std::ostream& out, const MonitorLine& line) {
    return out << "{" << line.node << ": \"" << line.text << "\" (" << line.code << ")}";
}

class MonitorCapture {
public:
    MonitorCapture() {
        Nimbo::PrivateServices::SetMonitorListener(
            [this](const ZelUnicodeString& node, const ZelUnicodeString& text, long code) {
                std::lock_guard<std::mutex> hold(lock_);
                lines_.push_back({node.str(), text.str(), code});
            });
    }
    ~MonitorCapture() { Nimbo::PrivateServices::SetMonitorListener(nullptr); }
    MonitorCapture(const MonitorCapture&) = delete;
    MonitorCapture& operator=(const MonitorCapture&) = delete;

    std::vector<MonitorLine> Lines() const {
        std::lock_guard<std::mutex> hold(lock_);
        return lines_;
    }
    // How many lines contain `fragment`.
    std::size_t Count(const std::string& fragment) const {
        std::lock_guard<std::mutex> hold(lock_);
        std::size_t count = 0;
        for (const MonitorLine& line : lines_) {
            if (line.text.find(fragment) != std::string::npos) ++count;
        }
        return count;
    }

private:
    mutable std::mutex lock_;
    std::vector<MonitorLine> lines_;
};

}  // namespace Testing
}  // namespace Tarn

#endif  // TARN_TESTS_PROTOCOL_MONITORCAPTURE_H_

#include <gtest/gtest.h>

#include <atomic>
#include <cstdlib>
#include <string>
#include <thread>
#include <tuple>
#include <vector>

#include "Nimbo/Context.h"
#include "Nimbo/Node.h"
#include "Nimbo/PrivateServices.h"
#include "Nimbo/ResultCodes.h"

namespace {

namespace Services = Nimbo::PrivateServices;

using ErrorRecord = std::pair<std::string, std::string>;  // message, source
using MonitorRecord = std::tuple<std::string, std::string, long>;

// Every test leaves the process-wide listeners at their defaults.
class PrivateServicesTest : public ::testing::Test {
  protected:
    void TearDown() override {
        Services::SetErrorListener(nullptr);
        Services::SetMonitorListener(nullptr);
    }

    void RecordErrors() {
        Services::SetErrorListener(
            [this](const ZelUnicodeString& message, const ZelUnicodeString& source) {
                errors.emplace_back(message.str(), source.str());
            });
    }
    void RecordMonitor() {
        Services::SetMonitorListener(
            [this](const ZelUnicodeString& node, const ZelUnicodeString& text, long code) {
                monitor.emplace_back(node.str(), text.str(), code);
            });
    }

    Nimbo::Context context;
    std::vector<ErrorRecord> errors;
    std::vector<MonitorRecord> monitor;
};

// Texts that printf-style or line-oriented handling would damage.
const char* const kAwkwardTexts[] = {
    "",
    "Parameters::ReadInt32() unknown property <missing>",
    "line one\nline two",
    "%s%n%d %%",
    "caf\xC3\xA9 \xF0\x9F\x98\x80",
    "<\\\"quoted\\\">",
};

TEST_F(PrivateServicesTest, ErrorsArriveUnchanged) {
    RecordErrors();
    std::vector<ErrorRecord> expected;
    for (const char* message : kAwkwardTexts) {
        for (const char* source : {"TarnCommandBinder", "", "%s"}) {
            Services::PublishError(context, message, source);
            expected.emplace_back(message, source);
        }
    }
    Services::PublishError(context, ZelUnicodeString("a\0b", 3), "src");
    expected.emplace_back(std::string("a\0b", 3), "src");
    EXPECT_EQ(errors, expected);
}

TEST_F(PrivateServicesTest, MonitorLinesArriveUnchanged) {
    RecordMonitor();
    std::vector<MonitorRecord> expected;
    for (const char* text : kAwkwardTexts) {
        for (long code : {S_OK, S_FALSE, E_FAIL, E_NOTIMPL, -1L}) {
            Services::Monitor("pool", text, code);
            expected.emplace_back("pool", text, code);
        }
    }
    Nimbo::Node node("server node \xC3\xA9");
    Services::Monitor(node, "OnBegin", 7);
    expected.emplace_back("server node \xC3\xA9", "OnBegin", 7);
    EXPECT_EQ(monitor, expected);
}

TEST_F(PrivateServicesTest, ErrorListenerIsReplacedThenRestoredByAnEmptyFunction) {
    std::vector<std::string> first;
    std::vector<std::string> second;
    Services::SetErrorListener(
        [&first](const ZelUnicodeString& m, const ZelUnicodeString&) { first.push_back(m.str()); });
    Services::PublishError(context, "one", "src");
    Services::SetErrorListener([&second](const ZelUnicodeString& m, const ZelUnicodeString&) {
        second.push_back(m.str());
    });
    Services::PublishError(context, "two", "src");
    EXPECT_EQ(first, std::vector<std::string>{"one"});
    EXPECT_EQ(second, std::vector<std::string>{"two"});

    Services::SetErrorListener(Services::ErrorListener());
    ::testing::internal::CaptureStderr();
    Services::PublishError(context, "unknown property <%s>", "TarnCommandBinder");
    EXPECT_EQ(::testing::internal::GetCapturedStderr(),
              "TarnCommandBinder: unknown property <%s>\n");
    EXPECT_EQ(first.size(), 1u);
    EXPECT_EQ(second.size(), 1u);
}

TEST_F(PrivateServicesTest, MonitorListenerIsReplacedThenRestoredByAnEmptyFunction) {
    RecordMonitor();
    Services::Monitor("node", "recorded", 1);
    Services::SetMonitorListener(Services::MonitorListener());
    ::testing::internal::CaptureStderr();
    Services::Monitor("node", "by default", 2);
    const std::string printed = ::testing::internal::GetCapturedStderr();
    // The default prints only when NIMBO_MONITOR is set.
    EXPECT_EQ(printed, std::getenv("NIMBO_MONITOR") != nullptr ? "node: by default (2)\n" : "");
    EXPECT_EQ(monitor, std::vector<MonitorRecord>{MonitorRecord("node", "recorded", 1)});
}

TEST_F(PrivateServicesTest, ErrorAndMonitorListenersAreIndependent) {
    RecordErrors();
    RecordMonitor();
    Services::SetErrorListener(nullptr);
    ::testing::internal::CaptureStderr();
    Services::PublishError(context, "message", "source");
    Services::Monitor("node", "line", 3);
    EXPECT_EQ(::testing::internal::GetCapturedStderr(), "source: message\n");
    EXPECT_TRUE(errors.empty());
    EXPECT_EQ(monitor, std::vector<MonitorRecord>{MonitorRecord("node", "line", 3)});
}

// Listeners swapped while other threads publish: every message reaches exactly one listener, and
// a replaced listener is never destroyed while it runs.
TEST_F(PrivateServicesTest, ThreadsPublishWhileListenersChange) {
    constexpr int kThreads = 3;
    constexpr int kMessages = 3000;
    std::atomic<int> toFirst{0};
    std::atomic<int> toSecond{0};
    std::atomic<int> monitored{0};
    std::atomic<bool> wrongText{false};
    auto listener = [&wrongText](std::atomic<int>& count) {
        return
            [&count, &wrongText](const ZelUnicodeString& message, const ZelUnicodeString& source) {
                if (message != "threaded" || source != "src") wrongText = true;
                ++count;
            };
    };
    Services::SetErrorListener(listener(toFirst));
    Services::SetMonitorListener(
        [&monitored](const ZelUnicodeString&, const ZelUnicodeString&, long) { ++monitored; });

    std::vector<std::thread> publishers;
    for (int t = 0; t < kThreads; ++t) {
        publishers.emplace_back([this] {
            for (int i = 0; i < kMessages; ++i) {
                Services::PublishError(context, "threaded", "src");
                Services::Monitor("node", "threaded", i);
            }
        });
    }
    for (int i = 0; i < 500; ++i) {
        Services::SetErrorListener(i % 2 == 0 ? listener(toSecond) : listener(toFirst));
        std::this_thread::yield();
    }
    for (std::thread& publisher : publishers) publisher.join();

    EXPECT_FALSE(wrongText);
    EXPECT_EQ(toFirst + toSecond, kThreads * kMessages);
    EXPECT_EQ(monitored, kThreads * kMessages);
}

}  // namespace

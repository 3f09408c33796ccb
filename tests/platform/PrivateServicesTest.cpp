#include <gtest/gtest.h>

#include <atomic>
#include <cstdlib>
#include <string>
#include <thread>
#include <vector>

#include "Nimbo/Context.h"
#include "Nimbo/Node.h"
#include "Nimbo/PrivateServices.h"
#include "Nimbo/ResultCodes.h"

namespace {

namespace Services = Nimbo::PrivateServices;
using ::testing::internal::CaptureStderr;
using ::testing::internal::GetCapturedStderr;
using Log = std::vector<std::string>;
using Z = ZelUnicodeString;

// Logs what reaches the listeners as "error <source>|<message>" or "<node>|<text>|<code>", and
// leaves the process-wide defaults in place afterwards.
class PrivateServicesTest : public ::testing::Test {
protected:
    void SetUp() override {
        Services::SetErrorListener([this](const Z& message, const Z& source) {
            log.push_back("error " + source.str() + "|" + message.str());
        });
        Services::SetMonitorListener([this](const Z& node, const Z& text, long code) {
            log.push_back(node.str() + "|" + text.str() + "|" + std::to_string(code));
        });
    }
    void TearDown() override {
        Services::SetErrorListener(nullptr);
        Services::SetMonitorListener(nullptr);
    }

    Nimbo::Context context;
    Log log;
};

// Texts that printf-style or line-oriented handling would damage arrive unchanged.
TEST_F(PrivateServicesTest, TextsArriveUnchanged) {
    // clang-format off
    const std::string texts[] = {"", "unknown property <missing>", "line one\nline two",
                                 "%s%n%d %%", "caf\xC3\xA9 \xF0\x9F\x98\x80", "<\\\"q\\\">",
                                 std::string("a\0b", 3)};
    // clang-format on
    for (const std::string& text : texts) {
        for (const std::string source : {"TarnCommandBinder", "", "%s"}) {
            log.clear();
            Services::PublishError(context, text, source);
            Services::Monitor(source, text, E_FAIL);
            EXPECT_EQ(log, (Log{"error " + source + "|" + text,
                                source + "|" + text + "|" + std::to_string(E_FAIL)}));
        }
    }
    log.clear();
    Nimbo::Node node("server node \xC3\xA9");
    Services::Monitor(node, "OnBegin", S_FALSE);
    EXPECT_EQ(log, Log{"server node \xC3\xA9|OnBegin|1"});
}

// Each listener is replaced on its own; an empty function restores its default.
TEST_F(PrivateServicesTest, ListenersAreReplacedAndRestoredIndependently) {
    Log second;
    Services::PublishError(context, "one", "src");
    Services::SetErrorListener([&second](const Z& m, const Z&) { second.push_back(m.str()); });
    Services::PublishError(context, "two", "src");
    Services::SetErrorListener(Services::ErrorListener());
    CaptureStderr();
    Services::PublishError(context, "unknown property <%s>", "TarnCommandBinder");
    Services::Monitor("node", "recorded", 1);
    EXPECT_EQ(GetCapturedStderr(), "TarnCommandBinder: unknown property <%s>\n");

    Services::SetMonitorListener(Services::MonitorListener());
    CaptureStderr();
    Services::Monitor("node", "by default", 2);
    // The default prints only when NIMBO_MONITOR is set.
    EXPECT_EQ(GetCapturedStderr(),
              std::getenv("NIMBO_MONITOR") != nullptr ? "node: by default (2)\n" : "");
    EXPECT_EQ(log, (Log{"error src|one", "node|recorded|1"}));
    EXPECT_EQ(second, Log{"two"});
}

// Listeners swapped while other threads publish: every message reaches exactly one listener, and
// a replaced listener is never destroyed while it runs.
TEST_F(PrivateServicesTest, ThreadsPublishWhileListenersChange) {
    constexpr int kThreads = 3;
    constexpr int kMessages = 3000;
    std::atomic<int> received{0};
    std::atomic<bool> wrongText{false};
    auto listener = [&received, &wrongText](const Z& message, const Z& source) {
        if (message != "threaded" || source != "src") wrongText = true;
        std::this_thread::yield();  // one replaced meanwhile must stay alive until it returns
        ++received;
    };
    Services::SetErrorListener(listener);
    std::vector<std::thread> publishers;
    for (int t = 0; t < kThreads; ++t) {
        publishers.emplace_back([this] {
            for (int i = 0; i < kMessages; ++i) Services::PublishError(context, "threaded", "src");
        });
    }
    for (int i = 0; i < 500; ++i) {
        Services::SetErrorListener(listener);  // a new copy each time, the old one released
        std::this_thread::yield();
    }
    for (std::thread& publisher : publishers) publisher.join();
    EXPECT_FALSE(wrongText);
    EXPECT_EQ(received, kThreads * kMessages);
}

}  // namespace

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "Nimbo/FunctionArgs1.h"

namespace {

using Callback = Nimbo::FunctionArgs1<long, const std::string&>;

long Length(const std::string& text) { return static_cast<long>(text.size()); }

struct Recorder {
    long Record(const std::string& text) {
        seen.push_back(text);
        return static_cast<long>(seen.size());
    }
    long Count(const std::string& text) const {
        long count = 0;
        for (const std::string& entry : seen) count += entry == text ? 1 : 0;
        return count;
    }
    std::vector<std::string> seen;
};

TEST(FunctionArgs1Test, PlainFunction) {
    Callback callback(&Length);
    ASSERT_TRUE(callback);
    EXPECT_EQ(callback("four"), 4);
    Callback implicit = Length;
    EXPECT_EQ(implicit(""), 0);
}

TEST(FunctionArgs1Test, ObjectAndMemberCallTheBoundObject) {
    Recorder recorder;
    Callback record(&recorder, &Recorder::Record);
    ASSERT_TRUE(record);
    EXPECT_EQ(record("a"), 1);
    EXPECT_EQ(record("b"), 2);
    EXPECT_EQ(recorder.seen, (std::vector<std::string>{"a", "b"}));

    const Recorder& view = recorder;
    Callback count(&view, &Recorder::Count);
    EXPECT_EQ(count("a"), 1);
    EXPECT_EQ(count("z"), 0);
}

TEST(FunctionArgs1Test, LambdaWithCaptures) {
    std::vector<std::string> received;
    const std::string prefix = "domain:";
    Callback callback([&received, prefix](const std::string& text) -> long {
        received.push_back(prefix + text);
        return 7;
    });
    ASSERT_TRUE(callback);
    EXPECT_EQ(callback("x"), 7);
    EXPECT_EQ(received, std::vector<std::string>{"domain:x"});

    // A capture that owns memory lives as long as the last copy.
    auto owned = std::make_shared<int>(5);
    Callback holder([owned](const std::string&) -> long { return *owned; });
    owned.reset();
    Callback copy = holder;
    holder = Callback();
    EXPECT_EQ(copy("ignored"), 5);
}

TEST(FunctionArgs1Test, CopiesShareOneStatefulCallable) {
    Callback counter([calls = 0L](const std::string&) mutable { return ++calls; });
    Callback copy = counter;
    EXPECT_EQ(counter(""), 1);
    EXPECT_EQ(copy(""), 2);
    EXPECT_EQ(counter(""), 3);
}

TEST(FunctionArgs1Test, EmptyBindingsConvertToFalseAndReturnADefaultValue) {
    Recorder* noObject = nullptr;
    long (Recorder::*noMember)(const std::string&) = nullptr;
    Recorder recorder;
    const std::vector<Callback> empties = {
        Callback(),
        Callback(static_cast<Callback::Function>(nullptr)),
        Callback(std::function<long(const std::string&)>()),
        Callback(noObject, &Recorder::Record),
        Callback(&recorder, noMember),
    };
    for (const Callback& empty : empties) {
        EXPECT_FALSE(empty);
        EXPECT_EQ(empty("anything"), 0);
    }
    EXPECT_TRUE(recorder.seen.empty());

    Nimbo::FunctionArgs1<std::string, int> text;
    EXPECT_EQ(text(3), "");
    Nimbo::FunctionArgs1<void, int> nothing;
    nothing(3);
}

TEST(FunctionArgs1Test, ValueArgumentsAndOtherResultTypes) {
    Nimbo::FunctionArgs1<std::string, std::string> echo(
        [](std::string text) { return text + text; });
    EXPECT_EQ(echo("ab"), "abab");

    int total = 0;
    Nimbo::FunctionArgs1<void, int> add([&total](int value) { total += value; });
    add(2);
    add(3);
    EXPECT_EQ(total, 5);
}

}  // namespace

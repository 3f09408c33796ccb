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
    long Ignore(const std::string&) const { return -1; }
    std::vector<std::string> seen;
};

TEST(FunctionArgs1Test, BindsEachKindOfCallable) {
    Recorder recorder;
    const std::string prefix = "domain:";
    const Callback function = Length;
    const Callback member(&recorder, &Recorder::Record);
    const Callback constMember(static_cast<const Recorder*>(&recorder), &Recorder::Ignore);
    const Callback lambda([&recorder, prefix](const std::string& text) {
        return recorder.Record(prefix + text) * 10;
    });
    EXPECT_TRUE(function && member && constMember && lambda);
    EXPECT_EQ(function("four"), 4);
    EXPECT_EQ(member("a"), 1);
    EXPECT_EQ(lambda("b"), 20);
    EXPECT_EQ(constMember("c"), -1);
    EXPECT_EQ(recorder.seen, (std::vector<std::string>{"a", "domain:b"}));

    Nimbo::FunctionArgs1<std::string, std::string> byValue([](std::string t) { return t + t; });
    EXPECT_EQ(byValue("ab"), "abab");
    int total = 0;
    Nimbo::FunctionArgs1<void, int> add([&total](int value) { total += value; });
    add(2);
    add(3);
    EXPECT_EQ(total, 5);
}

TEST(FunctionArgs1Test, CopiesShareTheCallableAndItsCaptures) {
    Callback counter([calls = 0L](const std::string&) mutable { return ++calls; });
    Callback copy = counter;
    EXPECT_EQ(counter("") + copy("") + counter(""), 1 + 2 + 3);
    auto owned = std::make_shared<int>(5);  // lives as long as the last copy
    Callback holder([owned](const std::string&) -> long { return *owned; });
    owned.reset();
    copy = holder;
    holder = Callback();
    EXPECT_EQ(copy("ignored"), 5);
}

TEST(FunctionArgs1Test, EmptyBindingsConvertToFalseAndReturnADefaultValue) {
    Recorder recorder;
    const Callback empties[] = {
        Callback(),
        Callback(static_cast<Callback::Function>(nullptr)),
        Callback(std::function<long(const std::string&)>()),
        Callback(static_cast<Recorder*>(nullptr), &Recorder::Record),
        Callback(&recorder, static_cast<long (Recorder::*)(const std::string&)>(nullptr)),
        Callback(static_cast<const Recorder*>(nullptr), &Recorder::Ignore),
    };
    for (const Callback& empty : empties) {
        EXPECT_FALSE(empty);
        EXPECT_EQ(empty("anything"), 0);
    }
    EXPECT_TRUE(recorder.seen.empty());
    EXPECT_EQ((Nimbo::FunctionArgs1<std::string, int>()(3)), "");
    Nimbo::FunctionArgs1<void, int>()(3);
}

}  // namespace

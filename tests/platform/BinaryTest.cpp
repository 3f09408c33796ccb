#include <gtest/gtest.h>

#include <atomic>
#include <climits>
#include <cstring>
#include <string>
#include <thread>
#include <tuple>
#include <vector>

#include "Nimbo/Binary.h"

namespace {

using Nimbo::Binary;

// Counts the releases of blocks made by Counted(); each test starts the count afresh.
std::atomic<int> releases{0};

void CountingRelease(const void* data) {
    ++releases;
    delete[] static_cast<const char*>(data);
}

Binary Counted(const std::string& text) {
    char* bytes = new char[text.size() + 1];
    std::memcpy(bytes, text.c_str(), text.size() + 1);
    return Binary(bytes, static_cast<unsigned int>(text.size()), CountingRelease);
}

std::string Text(const Binary& binary) {
    return std::string(static_cast<const char*>(binary.GetData()), binary.GetSize());
}

class BinaryTest : public ::testing::Test {
protected:
    void SetUp() override { releases = 0; }
};

// Copies and slices share the bytes, never duplicate them; the last one releases them once.
TEST_F(BinaryTest, CopiesAndSlicesShareTheBytesAndTheLastReleasesThem) {
    Binary slice;
    {
        Binary copy = Counted("0123456789");
        const char* data = static_cast<const char*>(copy.GetData());
        Binary moved(std::move(copy));
        Binary assigned;
        copy = moved;  // into a moved-from handle
        assigned = std::move(moved);
        moved = assigned;
        copy = static_cast<const Binary&>(copy);  // self-assignment keeps the block
        slice = moved.Slice(2, 6).Slice(1, 2);
        EXPECT_EQ(moved.GetData(), data);
        EXPECT_EQ(slice.GetData(), data + 3);
        const std::tuple<unsigned int, unsigned int, const char*> cases[] = {
            // clang-format off
            {0, 10, "0123456789"}, {2, 3, "234"}, {8, 5, "89"}, {9, 1, "9"}, {10, 1, ""},
            {11, 1, ""}, {3, 0, ""}, {0, UINT_MAX, "0123456789"}, {5, UINT_MAX, "56789"},
            {UINT_MAX, UINT_MAX, ""},
            // clang-format on
        };
        for (const auto& [offset, size, expected] : cases)
            EXPECT_EQ(Text(copy.Slice(offset, size)), expected) << offset << " " << size;
    }
    EXPECT_EQ(releases, 0);
    EXPECT_EQ(Text(slice), "34");  // the slice keeps the block alive
    slice = Binary();
    EXPECT_EQ(releases, 1);

    Binary binary = Counted("first");
    binary = Counted("second");  // reassigning releases the previous block
    EXPECT_EQ(releases, 2);
    binary = Binary();
    EXPECT_EQ(releases, 3);
    { Binary zeroSized(new char[1], 0, CountingRelease); }
    EXPECT_EQ(releases, 4);
    Binary fromNull(nullptr, 5, CountingRelease);  // empty, and nothing to release
    EXPECT_TRUE(fromNull.IsEmpty() && fromNull.GetData() == nullptr && fromNull.GetSize() == 0);
    fromNull = Binary();
    EXPECT_EQ(releases, 4);

    // deallocateArrayChar matches new[] (the sanitizers would report a mismatch or a leak);
    // noDeallocate and a null deallocator leave bytes the caller owns alone.
    { Binary owned(new char[16](), 16, Nimbo::deallocateArrayChar); }
    char stack[4] = {'a', 'b', 'c', 'd'};
    { Binary borrowed(stack, 4, Nimbo::noDeallocate), alsoBorrowed(stack, 4, nullptr); }
    EXPECT_EQ(std::string(stack, 4), "abcd");
}

TEST_F(BinaryTest, EqualityComparesBytes) {
    static const char abc[] = "abc";
    auto B = [](const char* data, unsigned int size) { return Binary(data, size, nullptr); };
    const std::tuple<Binary, Binary, bool> cases[] = {
        // clang-format off
        {B(abc, 3), B("xabcx", 5).Slice(1, 3), true}, {B(abc, 3), B("abd", 3), false},
        {B(abc, 3), B(abc, 2), false},                {B(abc, 3), Binary(), false},
        {Binary(), B(nullptr, 3), true},              {Binary(), B(abc, 0), true},
        {B(abc, 4), B("abc", 4), true},  // with the NUL
        // clang-format on
    };
    for (const auto& [left, right, equal] : cases) {
        SCOPED_TRACE(Text(left) + " / " + Text(right));
        EXPECT_EQ(left == right, equal);
        EXPECT_EQ(right == left, equal);
        EXPECT_EQ(left != right, !equal);
    }
    EXPECT_TRUE(B(abc, 3).IsEqual("abc", 3));
    EXPECT_FALSE(B(abc, 3).IsEqual(nullptr, 3));
    EXPECT_FALSE(B(abc, 3).IsEqual(nullptr, 0));
    EXPECT_TRUE(Binary().IsEqual(nullptr, 0));
}

// Copies made and dropped on several threads at once still release the block exactly once.
TEST_F(BinaryTest, ThreadsShareOneBlock) {
    {
        const Binary shared = Counted("shared bytes");
        std::atomic<int> mismatches{0};
        std::vector<std::thread> threads;
        for (unsigned int t = 0; t < 4; ++t) {
            threads.emplace_back([shared, &mismatches, t] {
                for (int i = 0; i < 2000; ++i) {
                    const Binary copy = shared;
                    if (Text(copy.Slice(t, 6)) != std::string("shared bytes").substr(t, 6))
                        ++mismatches;
                }
            });
        }
        for (std::thread& thread : threads) thread.join();
        EXPECT_EQ(mismatches, 0);
        EXPECT_EQ(releases, 0);
    }
    EXPECT_EQ(releases, 1);
}

}  // namespace

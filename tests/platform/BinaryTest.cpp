#include <gtest/gtest.h>

#include <atomic>
#include <climits>
#include <cstring>
#include <string>
#include <thread>
#include <vector>

#include "Nimbo/Binary.h"

namespace {

// A deallocator that counts its calls and remembers the last pointer it released. The deallocator
// type is a plain function pointer, so the record is global; each test starts it afresh.
std::atomic<int> releases{0};
std::atomic<const void*> lastReleased{nullptr};

void CountingRelease(const void* data) {
    lastReleased = data;
    ++releases;
    delete[] static_cast<const char*>(data);
}

class BinaryTest : public ::testing::Test {
  protected:
    void SetUp() override {
        releases = 0;
        lastReleased = nullptr;
    }

    // A block holding `text` in new[]-allocated bytes, released through CountingRelease.
    static Nimbo::Binary Counted(const std::string& text) {
        char* bytes = new char[text.size() + 1];
        std::memcpy(bytes, text.c_str(), text.size() + 1);
        return Nimbo::Binary(bytes, static_cast<unsigned int>(text.size()), CountingRelease);
    }
};

std::string Text(const Nimbo::Binary& binary) {
    if (binary.GetData() == nullptr) return std::string();
    return std::string(static_cast<const char*>(binary.GetData()), binary.GetSize());
}

TEST_F(BinaryTest, LastCopyReleasesTheBytesOnce) {
    const void* data;
    {
        Nimbo::Binary original = Counted("payload");
        data = original.GetData();
        Nimbo::Binary copy(original);
        Nimbo::Binary assigned;
        assigned = copy;
        Nimbo::Binary moved(std::move(original));
        Nimbo::Binary moveAssigned;
        moveAssigned = std::move(assigned);
        assigned = moveAssigned;  // assign back into a moved-from handle
        Nimbo::Binary& alias = copy;
        copy = alias;  // self-assignment keeps the block
        EXPECT_EQ(Text(copy), "payload");
        EXPECT_EQ(copy.GetData(), data);  // copies share the bytes, never duplicate them
        EXPECT_EQ(releases, 0);
    }
    EXPECT_EQ(releases, 1);
    EXPECT_EQ(lastReleased, data);
}

TEST_F(BinaryTest, ReassigningReleasesThePreviousBlock) {
    Nimbo::Binary binary = Counted("first");
    binary = Counted("second");
    EXPECT_EQ(releases, 1);
    EXPECT_EQ(Text(binary), "second");
    binary = Nimbo::Binary();
    EXPECT_EQ(releases, 2);
}

TEST_F(BinaryTest, SlicesKeepTheBlockAlive) {
    Nimbo::Binary slice;
    Nimbo::Binary ofSlice;
    {
        Nimbo::Binary whole = Counted("0123456789");
        slice = whole.Slice(2, 6);
        ofSlice = slice.Slice(1, 2);
        EXPECT_EQ(slice.GetData(), static_cast<const char*>(whole.GetData()) + 2);
    }
    EXPECT_EQ(releases, 0);
    EXPECT_EQ(Text(slice), "234567");
    EXPECT_EQ(Text(ofSlice), "34");
    slice = Nimbo::Binary();
    EXPECT_EQ(releases, 0);
    ofSlice = Nimbo::Binary();
    EXPECT_EQ(releases, 1);
}

struct SliceCase {
    unsigned int offset;
    unsigned int size;
    const char* expected;
};

TEST_F(BinaryTest, SliceClipsToTheBytesThatExist) {
    const Nimbo::Binary whole = Counted("0123456789");
    const SliceCase cases[] = {
        {0, 10, "0123456789"},
        {2, 3, "234"},
        {8, 5, "89"},
        {9, 1, "9"},
        {10, 1, ""},
        {11, 1, ""},
        {3, 0, ""},
        {0, UINT_MAX, "0123456789"},
        {5, UINT_MAX, "56789"},
        {UINT_MAX, UINT_MAX, ""},
    };
    for (const SliceCase& c : cases) {
        Nimbo::Binary slice = whole.Slice(c.offset, c.size);
        EXPECT_EQ(Text(slice), c.expected) << c.offset << "," << c.size;
        EXPECT_EQ(slice.GetSize(), std::strlen(c.expected)) << c.offset << "," << c.size;
        EXPECT_EQ(slice.IsEmpty(), *c.expected == '\0') << c.offset << "," << c.size;
    }
    EXPECT_TRUE(Nimbo::Binary().Slice(0, 5).IsEmpty());
}

TEST_F(BinaryTest, NullDataIsEmptyAndNeverReleased) {
    Nimbo::Binary fromNull(nullptr, 5, CountingRelease);
    EXPECT_EQ(fromNull.GetData(), nullptr);
    EXPECT_EQ(fromNull.GetSize(), 0u);
    EXPECT_TRUE(fromNull.IsEmpty());
    Nimbo::Binary empty;
    EXPECT_EQ(empty.GetData(), nullptr);
    EXPECT_TRUE(empty.IsEmpty());
    fromNull = Nimbo::Binary();
    EXPECT_EQ(releases, 0);
}

TEST_F(BinaryTest, ZeroSizedBlockIsStillReleased) {
    { Nimbo::Binary empty(new char[1], 0, CountingRelease); }
    EXPECT_EQ(releases, 1);
}

TEST_F(BinaryTest, ProvidedDeallocators) {
    // deallocateArrayChar matches new[] (the sanitizers would report a mismatch or a leak);
    // noDeallocate and a null deallocator leave bytes the caller owns alone.
    { Nimbo::Binary owned(new char[16](), 16, Nimbo::deallocateArrayChar); }
    char stack[4] = {'a', 'b', 'c', 'd'};
    { Nimbo::Binary borrowed(stack, 4, Nimbo::noDeallocate); }
    { Nimbo::Binary borrowed(stack, 4, nullptr); }
    EXPECT_EQ(stack[0], 'a');
}

struct EqualCase {
    Nimbo::Binary left;
    Nimbo::Binary right;
    bool equal;
};

TEST_F(BinaryTest, EqualityComparesBytes) {
    static const char abc[] = "abc";
    static const char abd[] = "abd";
    static const char other[] = "xabcx";
    const Nimbo::Binary whole(other, 5, nullptr);
    const EqualCase cases[] = {
        {Nimbo::Binary(abc, 3, nullptr), Nimbo::Binary(other + 1, 3, nullptr), true},
        {Nimbo::Binary(abc, 3, nullptr), whole.Slice(1, 3), true},
        {Nimbo::Binary(abc, 3, nullptr), Nimbo::Binary(abd, 3, nullptr), false},
        {Nimbo::Binary(abc, 3, nullptr), Nimbo::Binary(abc, 2, nullptr), false},
        {Nimbo::Binary(abc, 3, nullptr), Nimbo::Binary(), false},
        {Nimbo::Binary(), Nimbo::Binary(), true},
        {Nimbo::Binary(), Nimbo::Binary(nullptr, 3, nullptr), true},
        {Nimbo::Binary(), Nimbo::Binary(abc, 0, nullptr), true},
        {Nimbo::Binary(abc, 4, nullptr), Nimbo::Binary("abc", 4, nullptr), true},  // with the NUL
    };
    for (const EqualCase& c : cases) {
        EXPECT_EQ(c.left == c.right, c.equal) << Text(c.left) << " == " << Text(c.right);
        EXPECT_EQ(c.right == c.left, c.equal) << Text(c.right) << " == " << Text(c.left);
        EXPECT_EQ(c.left != c.right, !c.equal) << Text(c.left) << " != " << Text(c.right);
    }
}

TEST_F(BinaryTest, IsEqualWithRawBytes) {
    const Nimbo::Binary binary("abc", 3, nullptr);
    EXPECT_TRUE(binary.IsEqual("abc", 3));
    EXPECT_FALSE(binary.IsEqual("abd", 3));
    EXPECT_FALSE(binary.IsEqual("ab", 2));
    EXPECT_FALSE(binary.IsEqual(nullptr, 3));
    EXPECT_FALSE(binary.IsEqual(nullptr, 0));
    EXPECT_TRUE(Nimbo::Binary().IsEqual(nullptr, 0));
    EXPECT_TRUE(Nimbo::Binary().IsEqual("", 0));
}

// Copies made and dropped on several threads at once still release the block exactly once.
TEST_F(BinaryTest, ThreadsShareOneBlock) {
    constexpr int kThreads = 4;
    {
        Nimbo::Binary shared = Counted("shared bytes");
        std::vector<std::thread> threads;
        std::atomic<int> mismatches{0};
        for (int t = 0; t < kThreads; ++t) {
            threads.emplace_back([shared, &mismatches, t] {
                for (int i = 0; i < 2000; ++i) {
                    Nimbo::Binary copy = shared;
                    Nimbo::Binary slice = copy.Slice(static_cast<unsigned int>(t), 6);
                    if (Text(slice) != std::string("shared bytes").substr(t, 6)) ++mismatches;
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

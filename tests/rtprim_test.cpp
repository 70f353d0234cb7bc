#include <services/rtprim.h>

#include <gtest/gtest.h>

#include <stdint.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>
#include <random>
#include <string>
#include <vector>

namespace {

TEST(RtprimHeap, BlocksAreUsableAndReleasedWithFree) {
    free(HMalloc(0));
    unsigned char* zeroed = static_cast<unsigned char*>(HCalloc(sizeof(char*), 37));
    EXPECT_EQ(std::count(zeroed, zeroed + sizeof(char*) * 37, 0),
              static_cast<long>(sizeof(char*) * 37));
    free(zeroed);
    char* grown = static_cast<char*>(HRealloc(nullptr, 4));
    memcpy(grown, "abc", 4);
    grown = static_cast<char*>(HRealloc(grown, 100000));
    EXPECT_STREQ(grown, "abc");
    free(HRealloc(grown, 0));
    EXPECT_EQ(HString(nullptr), nullptr);
}

// Prefaulting is a hint: whatever pages it touches, inside the block or
// shared with its neighbours at either end, keep their bytes.
TEST(RtprimHeap, PrefaultKeepsEveryByte) {
    const size_t size = 3 * 65536 + 123;
    std::vector<unsigned char> pattern(size);
    std::mt19937 random(7);
    for (unsigned char& byte : pattern) {
        byte = static_cast<unsigned char>(random());
    }
    unsigned char* block = static_cast<unsigned char*>(HMalloc(size));
    memcpy(block, pattern.data(), size);
    const size_t spans[][2] = {{0, size}, {1, 4095}, {4097, 8191}, {17, 0}, {size - 5, 5}};
    for (const auto& span : spans) {
        HPrefault(block + span[0], span[1]);
        ASSERT_EQ(memcmp(block, pattern.data(), size), 0) << span[0] << "+" << span[1];
    }
    HPrefault(nullptr, 0);
    free(block);
}

TEST(RtprimHeapDeathTest, OverflowingSizeEndsTheProcessWithAMessage) {
    EXPECT_DEATH(HCalloc(SIZE_MAX / 2, 4), "out of memory");
}

TEST(RtprimMkName, TextsStayValidForThirtyOneFurtherCalls) {
    std::vector<const char*> texts;
    for (size_t i = 0; i < 32; ++i) {
        texts.push_back(
            MkName("text %d %s", static_cast<int>(i), std::string(i * 40, 'x').c_str()));
    }
    for (size_t i = 0; i < 32; ++i) {
        EXPECT_EQ(texts[i], "text " + std::to_string(i) + " " + std::string(i * 40, 'x'));
    }
    // Long texts grow the buffer instead of being cut.
    std::string longText(100000, 'y');
    EXPECT_EQ(std::string(MkName("%s!", longText.c_str())), longText + "!");
    EXPECT_STREQ(MkName("%d,%c", 22, 'q'), "22,q");
}

TEST(RtprimMkName, DoublesReadBackExactly) {
    std::mt19937_64 random(12345);
    for (int i = 0; i < 100000; ++i) {
        uint64_t bits = random();
        double value;
        memcpy(&value, &bits, sizeof value);
        if (value == value) {  // NaN has no exact text
            ASSERT_EQ(atof(MkName(value, -1)), value) << MkName(value, -1);
        }
    }
    for (double value : {-0.0, 1.0 / 3.0, 1e300, 5e-324, 123456789.125}) {
        EXPECT_EQ(atof(MkName(value, -1)), value);
    }
    EXPECT_STREQ(MkName(0.1, -1), "0.1");
    EXPECT_STREQ(MkName(2.0, 3), "2.000");
    EXPECT_STREQ(MkName(-1.25, 1), "-1.2");
}

const char* TestCatalogue(const char* message) {
    return strcmp(message, "Cancel") == 0 ? "Abbrechen" : nullptr;
}

TEST(RtprimTranslate, CatalogueHookAndFallback) {
    EXPECT_STREQ(_("Cancel"), "Cancel");
    EXPECT_STREQ(_(nullptr), "");
    RTMessageCatalogue previous = RTSetMessageCatalogue(TestCatalogue);
    EXPECT_EQ(previous, nullptr);
    EXPECT_STREQ(_("Cancel"), "Abbrechen");
    EXPECT_STREQ(_("OK"), "OK");
    EXPECT_EQ(RTSetMessageCatalogue(nullptr), TestCatalogue);
    EXPECT_STREQ(_("Cancel"), "Cancel");
}

TEST(RtprimCase, AsciiOnlyInPlace) {
    char text[] = "Mixed 123 \xC3\xA4 Case";
    EXPECT_STREQ(UCaseString(text), "MIXED 123 \xC3\xA4 CASE");
    EXPECT_STREQ(LCaseString(text), "mixed 123 \xC3\xA4 case");
    EXPECT_EQ(UCaseString(nullptr), nullptr);
}

TEST(RtprimScanDouble, ReadsOnlyTheGivenLength) {
    struct Case {
        const char* text;
        int length;
        double expected;
    } cases[] = {
        {"12345", 3, 123.0},
        {"1.5e3", 4, 1.5},
        {"1.5e3", 5, 1500.0},
        {"  -2.25x", 8, -2.25},
        {"abc", 3, 0.0},
        {"42", 0, 0.0},
        {"42", -1, 0.0},
        {"7\0"
         "99",
         4, 7.0},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(ScanDouble(c.text, c.length), c.expected) << c.text << " " << c.length;
    }
    EXPECT_EQ(ScanDouble(nullptr, 4), 0.0);

    // An unterminated block: reading one byte past it is caught by the sanitizers.
    char* digits = static_cast<char*>(HMalloc(6));
    memcpy(digits, "314159", 6);
    EXPECT_EQ(ScanDouble(digits, 6), 314159.0);
    EXPECT_EQ(ScanDouble(digits, 2), 31.0);
    free(digits);

    std::string padded = std::string(300, ' ') + "6.5";
    EXPECT_EQ(ScanDouble(padded.c_str(), static_cast<int>(padded.size())), 6.5);
}

int CompareInts(const void* a, const void* b) {
    int x = *static_cast<const int*>(a);
    int y = *static_cast<const int*>(b);
    return (x > y) - (x < y);
}

TEST(RtprimSort, AgreesWithQsort) {
    std::mt19937 random(7);
    for (size_t count : {0u, 1u, 2u, 3u, 17u, 1000u, 50000u}) {
        std::vector<int> values(count);
        for (int& v : values) {
            v = static_cast<int>(random() % 100) - 50;  // many duplicates
        }
        std::vector<int> expected = values;
        if (count) {
            qsort(expected.data(), count, sizeof(int), CompareInts);
        }
        TZN_qsort(values.data(), count, sizeof(int), CompareInts);
        EXPECT_EQ(values, expected) << count;
    }
    TZN_qsort(nullptr, 0, sizeof(int), CompareInts);
}

}  // namespace

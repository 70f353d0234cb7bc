#include <services/rtprim.h>

#include <gtest/gtest.h>

#include <float.h>
#include <stdint.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>
#include <string>
#include <thread>
#include <vector>

namespace {

// Prefaulting is a hint: whatever pages it touches, inside the block or
// shared with its neighbours at either end, keep their bytes.
TEST(RtprimHeap, BlocksKeepTheirBytes) {
    EXPECT_EQ(HString(nullptr), nullptr);
    const size_t size = 3 * 65536 + 123;
    std::vector<unsigned char> pattern(size);
    for (size_t i = 0; i < size; ++i) {
        pattern[i] = static_cast<unsigned char>(i % 251 + 1);  // no period divides a page
    }
    unsigned char* block = static_cast<unsigned char*>(HCalloc(size, 1));
    EXPECT_TRUE(std::all_of(block, block + size, [](unsigned char byte) { return byte == 0; }));
    block = static_cast<unsigned char*>(HRealloc(block, 10));
    memcpy(block, pattern.data(), 10);
    block = static_cast<unsigned char*>(HRealloc(block, size));  // grows, keeping its start
    memcpy(block + 10, pattern.data() + 10, size - 10);
    const size_t spans[][2] = {{0, size}, {1, 4095}, {4097, 8191}, {size - 5, 5}};
    for (const auto& span : spans) {
        HPrefault(block + span[0], span[1]);
        ASSERT_EQ(memcmp(block, pattern.data(), size), 0) << span[0] << "+" << span[1];
    }
    HPrefault(nullptr, 0);
    free(HRealloc(HRealloc(nullptr, 4), 0));
    free(block);
}

TEST(RtprimHeapDeathTest, OverflowingSizeEndsTheProcessWithAMessage) {
    EXPECT_DEATH(HCalloc(SIZE_MAX / 2, 4), "out of memory");
}

// Texts stay valid for 31 further calls and grow instead of being cut;
// doubles read back exactly.
TEST(RtprimMkName, TextsStayValidAndGrow) {
    std::vector<const char*> texts;
    for (int i = 0; i < 32; ++i) {
        texts.push_back(MkName("text %d %s", i, std::string(i * 40, 'x').c_str()));
    }
    for (int i = 0; i < 32; ++i) {
        EXPECT_EQ(texts[i], "text " + std::to_string(i) + " " + std::string(i * 40, 'x'));
    }
    // A fresh thread's ring has no room to spare, so the sanitizers see a
    // buffer one byte short.
    std::thread([] {
        const std::string text(127, 'y');
        EXPECT_EQ(MkName("%s!", text.c_str()), text + "!");
    }).join();

    for (double value : {1.0 / 3, 5e-324, -2.2250738585072014e-308, -DBL_MAX}) {
        EXPECT_EQ(atof(MkName(value, -1)), value) << MkName(value, -1);
    }
    EXPECT_STREQ(MkName(0.1, -1), "0.1");
    EXPECT_STREQ(MkName(-1.25, 1), "-1.2");
    EXPECT_EQ(strlen(MkName(-DBL_MAX, 2)), 313u);  // 309 digits before the point
}

TEST(RtprimText, TranslationAndCase) {
    EXPECT_STREQ(_(nullptr), "");
    RTMessageCatalogue catalogue = [](const char* message) -> const char* {
        return strcmp(message, "Cancel") == 0 ? "Abbrechen" : nullptr;
    };
    EXPECT_EQ(RTSetMessageCatalogue(catalogue), nullptr);
    EXPECT_EQ(std::string(_("Cancel")) + _("OK"), "AbbrechenOK");
    EXPECT_EQ(RTSetMessageCatalogue(nullptr), catalogue);
    EXPECT_STREQ(_("Cancel"), "Cancel");

    char text[] = "Mixed 123 \xC3\xA4 Case";
    EXPECT_STREQ(UCaseString(text), "MIXED 123 \xC3\xA4 CASE");
    EXPECT_STREQ(LCaseString(text), "mixed 123 \xC3\xA4 case");
    EXPECT_EQ(UCaseString(nullptr), nullptr);
}

TEST(RtprimScanDouble, ReadsOnlyTheGivenLength) {
    const std::string padded = std::string(300, ' ') + "6.5";
    const struct {
        const char* text;
        int length;
        double expected;
    } cases[] = {{"12345", 3, 123.0}, {"  -2.25x", 8, -2.25},     {"42", -1, 0.0},
                 {"7\00099", 4, 7.0}, {padded.c_str(), 303, 6.5}, {nullptr, 4, 0.0}};
    for (const auto& c : cases) {
        EXPECT_EQ(ScanDouble(c.text, c.length), c.expected) << c.length;
    }
    // An unterminated block: reading one byte past it is caught by the sanitizers.
    char* digits = static_cast<char*>(HMalloc(6));
    memcpy(digits, "314159", 6);
    EXPECT_EQ(ScanDouble(digits, 6) + ScanDouble(digits, 2), 314159.0 + 31.0);
    free(digits);
}

}  // namespace

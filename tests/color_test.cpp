#include "container_test_util.h"

#include <dwxcore/dwxcolor.h>

#include <gtest/gtest.h>

#include <ctype.h>
#include <stdio.h>
#include <stdlib.h>

#include <algorithm>
#include <string>
#include <vector>

namespace {

std::string Argb(const DWXColor& c) {
    return std::to_string(c.GetAlpha()) + " " + std::to_string(c.GetRed()) + " " +
           std::to_string(c.GetGreen()) + " " + std::to_string(c.GetBlue());
}

std::vector<std::string> NamedColors() {
    char** names = GetNamedColors();
    std::vector<std::string> result;
    for (char** name = names; *name != nullptr; ++name)
        result.push_back(*name);
    free(names);
    return result;
}

// The built-in name (Grey), the display name (Gray) and the components.
const struct {
    const char *builtin, *display;
    int red, green, blue;
} kTable[] = {
    {"White", "White", 255, 255, 255},    {"Red", "Red", 255, 0, 0},
    {"Green", "Green", 0, 255, 0},        {"Blue", "Blue", 0, 0, 255},
    {"Yellow", "Yellow", 255, 255, 0},    {"Black", "Black", 0, 0, 0},
    {"Orange", "Orange", 255, 128, 0},    {"Magenta", "Magenta", 255, 0, 255},
    {"Cyan", "Cyan", 0, 255, 255},        {"Grey", "Gray", 128, 128, 128},
    {"DarkGrey", "DarkGray", 64, 64, 64}, {"LightGrey", "LightGray", 196, 196, 196},
    {"Pink", "Pink", 255, 0, 255},
};

}  // namespace

TEST(ColorTest, BytesAlphaEqualityAndDump) {
    EXPECT_EQ(Argb(DWXColor()), "0 0 0 0");
    EXPECT_EQ(Argb(DWXColor(300, -1, 0)), "255 44 255 0");
    EXPECT_EQ(Argb(DWXColor(256, 511, -256, 1000)), "0 255 0 232");
    EXPECT_NE(DWXColor(), DWXColor(0, 0, 0));  // alpha takes part
    EXPECT_TRUE(DWXColor(1, 2, 3) == DWXColor(255, 1, 2, 3));

    DWXColor color(9, 1, 2, 3);
    color.SetRGB(4, 5, 6);
    EXPECT_EQ(Argb(color), "255 4 5 6");
    color.SetARGB(-2, 7, 8, 9);
    DWXColor copy(color), assigned;
    assigned = color;
    EXPECT_EQ(Argb(copy), "254 7 8 9");
    EXPECT_EQ(assigned, color);

    EXPECT_EQ(Captured([&](FILE* f) { color.Dump(f); }), "<DWXColor:7,8,9>\n");
    color.Dump(nullptr);  // writes nothing, as every other Dump
    EXPECT_STREQ(color.GetClassName(), "DWXColor");
}

TEST(ColorTest, TableNamesInEitherSpellingAndAnyCase) {
    for (const auto& row : kTable) {
        std::string upper = row.builtin, lower = row.display;
        std::transform(upper.begin(), upper.end(), upper.begin(), ::toupper);
        std::transform(lower.begin(), lower.end(), lower.begin(), ::tolower);
        for (const std::string& name :
             {std::string(row.builtin), std::string(row.display), upper, lower}) {
            DWXColor color;
            EXPECT_TRUE(color.SetByName(name.c_str())) << name;
            EXPECT_EQ(color, DWXColor(row.red, row.green, row.blue)) << name;
        }
    }
    // GetName gives the first display name with those components, alpha ignored.
    EXPECT_STREQ(DWXColor(0, 255, 0, 0).GetName(), "Red");
    EXPECT_STREQ(DWXColor(255, 0, 255).GetName(), "Magenta");
    EXPECT_STREQ(DWXColor(128, 128, 128).GetName(), "Gray");
    EXPECT_STREQ(DWXColor(192, 192, 192).GetName(), "(RGB:192 192 192)");
}

TEST(ColorTest, RgbTextNeedsThreeNumbersAndFailuresChangeNothing) {
    const struct {
        const char* text;
        bool found;
        const char* expected;
    } cases[] = {
        {"(RGB:10 20 30)", true, "255 10 20 30"},
        {"colour RGB:  1\t2 3 4", true, "255 1 2 3"},
        {"RGB:300 -1 0", true, "255 44 255 0"},
        {"RGB:99999999999 1 2", true, "255 255 1 2"},  // beyond int: still the low byte
        {"rgb:10 20 30", false, "7 8 9 10"},           // "RGB:" is case-sensitive
        {"RGB:10 20", false, "7 8 9 10"},
        {"", false, "7 8 9 10"},
        {"NoSuchColour", false, "7 8 9 10"},
        {nullptr, false, "7 8 9 10"},
    };
    for (const auto& c : cases) {
        DWXColor color(7, 8, 9, 10);
        EXPECT_EQ(color.SetByName(c.text), c.found) << (c.text ? c.text : "null");
        EXPECT_EQ(Argb(color), c.expected) << (c.text ? c.text : "null");
    }
    for (int value = 0; value < 256 * 256 * 256; value += 40009) {
        const DWXColor source(3, value >> 16, value >> 8, value);
        DWXColor back;
        ASSERT_TRUE(back.SetByName(source.GetName()));
        ASSERT_EQ(back, DWXColor(value >> 16, value >> 8, value)) << source.GetName();
    }
}

// The registry is process-wide: its story is told in one test that leaves it
// as the other tests expect it.
TEST(ColorTest, RegistryStartsWithTheDisplayNamesAndGrowsInOrder) {
    std::vector<std::string> expected;
    for (const auto& row : kTable)
        expected.push_back(row.display);
    EXPECT_EQ(NamedColors(), expected);
    char** first = GetNamedColors();
    char** second = GetNamedColors();
    EXPECT_EQ(first[12], second[12]);  // the registry's own names, not copies
    free(first);
    free(second);

    AddNamedColor("Sky", DWXColor(0, 1, 2, 3));
    AddNamedColor("RED", DWXColor(9, 9, 9));  // updates Red, keeps its spelling
    AddNamedColor(nullptr, DWXColor(1, 1, 1));
    AddNamedColor("Grey", DWXColor(1, 1, 1));  // registry before built-in names
    expected.push_back("Sky");
    expected.push_back("Grey");
    EXPECT_EQ(NamedColors(), expected);

    DWXColor color;
    EXPECT_TRUE(color.SetByName("sKY"));
    EXPECT_EQ(Argb(color), "255 1 2 3");
    EXPECT_STREQ(color.GetName(), "Sky");
    EXPECT_TRUE(color.SetByName("Red"));
    EXPECT_EQ(Argb(color), "255 9 9 9");
    EXPECT_TRUE(color.SetByName("grey"));
    EXPECT_EQ(Argb(color), "255 1 1 1");
    EXPECT_STREQ(DWXColor(255, 0, 0).GetName(), "(RGB:255 0 0)");

    AddNamedColor("Red", DWXColor(255, 0, 0));
    AddNamedColor("Grey", DWXColor(128, 128, 128));
    EXPECT_STREQ(DWXColor(255, 0, 0).GetName(), "Red");
    EXPECT_STREQ(DWXColor(128, 128, 128).GetName(), "Gray");
}

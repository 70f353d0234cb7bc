#include <dwxcore/dwxcolor.h>

#include <gtest/gtest.h>

#include <ctype.h>
#include <stdio.h>
#include <stdlib.h>

#include <string>
#include <vector>

namespace {

struct Argb {
    int alpha, red, green, blue;
};

void ExpectArgb(const DWXColor& color, Argb expected) {
    EXPECT_EQ(color.GetAlpha(), expected.alpha);
    EXPECT_EQ(color.GetRed(), expected.red);
    EXPECT_EQ(color.GetGreen(), expected.green);
    EXPECT_EQ(color.GetBlue(), expected.blue);
}

std::vector<std::string> NamedColors() {
    char** names = GetNamedColors();
    std::vector<std::string> result;
    for (char** name = names; *name != nullptr; ++name) {
        result.push_back(*name);
    }
    free(names);
    return result;
}

std::string DumpOf(const DWXColor& color) {
    char* buffer = nullptr;
    size_t size = 0;
    FILE* stream = open_memstream(&buffer, &size);
    color.Dump(stream);
    fclose(stream);
    std::string text(buffer, size);
    free(buffer);
    return text;
}

// The two built-in tables: the name written with Grey, the display name
// written with Gray, and the components.
struct TableRow {
    const char* builtin;
    const char* display;
    int red, green, blue;
};
const TableRow kTable[] = {
    {"White", "White", 255, 255, 255},    {"Red", "Red", 255, 0, 0},
    {"Green", "Green", 0, 255, 0},        {"Blue", "Blue", 0, 0, 255},
    {"Yellow", "Yellow", 255, 255, 0},    {"Black", "Black", 0, 0, 0},
    {"Orange", "Orange", 255, 128, 0},    {"Magenta", "Magenta", 255, 0, 255},
    {"Cyan", "Cyan", 0, 255, 255},        {"Grey", "Gray", 128, 128, 128},
    {"DarkGrey", "DarkGray", 64, 64, 64}, {"LightGrey", "LightGray", 196, 196, 196},
    {"Pink", "Pink", 255, 0, 255},
};

}  // namespace

TEST(ColorTest, ComponentsKeepTheirLowByteAndAlphaFollowsTheConstructor) {
    ExpectArgb(DWXColor(), {0, 0, 0, 0});
    ExpectArgb(DWXColor(0, 0, 0), {255, 0, 0, 0});
    ExpectArgb(DWXColor(300, -1, 0), {255, 44, 255, 0});
    ExpectArgb(DWXColor(7, 1, 2, 3), {7, 1, 2, 3});
    ExpectArgb(DWXColor(256, 511, -256, 1000), {0, 255, 0, 232});

    DWXColor color(9, 1, 2, 3);
    color.SetRGB(4, 5, 6);
    ExpectArgb(color, {255, 4, 5, 6});
    color.SetARGB(-2, 7, 8, 9);
    ExpectArgb(color, {254, 7, 8, 9});
}

TEST(ColorTest, EqualityIncludesAlphaAndCopiesTakeAllFourBytes) {
    EXPECT_NE(DWXColor(), DWXColor(0, 0, 0));
    EXPECT_TRUE(DWXColor(0, 0, 0, 0) == DWXColor());
    EXPECT_TRUE(DWXColor(1, 2, 3) == DWXColor(255, 1, 2, 3));
    EXPECT_FALSE(DWXColor(1, 2, 3) != DWXColor(255, 1, 2, 3));
    EXPECT_NE(DWXColor(1, 2, 3), DWXColor(1, 2, 4));

    const DWXColor source(5, 6, 7, 8);
    DWXColor copy(source);
    ExpectArgb(copy, {5, 6, 7, 8});
    DWXColor assigned(1, 1, 1);
    assigned = source;
    EXPECT_EQ(assigned, source);
}

TEST(ColorTest, DumpShowsRedGreenBlueButNotAlpha) {
    EXPECT_EQ(DumpOf(DWXColor(9, 1, 2, 3)), "<DWXColor:1,2,3>\n");
    EXPECT_EQ(DumpOf(DWXColor()), "<DWXColor:0,0,0>\n");
    EXPECT_STREQ(DWXColor().GetClassName(), "DWXColor");
}

TEST(ColorTest, EveryTableNameInEitherSpellingAndAnyCaseGivesItsComponents) {
    for (const TableRow& row : kTable) {
        std::string upper = row.builtin, lower = row.display;
        for (char& c : upper)
            c = static_cast<char>(toupper(c));
        for (char& c : lower)
            c = static_cast<char>(tolower(c));
        for (const std::string& name :
             {std::string(row.builtin), std::string(row.display), upper, lower}) {
            SCOPED_TRACE(name);
            DWXColor color;
            EXPECT_TRUE(color.SetByName(name.c_str()));
            ExpectArgb(color, {255, row.red, row.green, row.blue});
        }
    }
}

TEST(ColorTest, GetNameGivesTheFirstDisplayNameOrTheRgbText) {
    const struct {
        DWXColor color;
        const char* name;
    } cases[] = {
        {DWXColor(255, 0, 0), "Red"},
        {DWXColor(0, 255, 0, 0), "Red"},  // alpha plays no part
        {DWXColor(255, 0, 255), "Magenta"},
        {DWXColor(128, 128, 128), "Gray"},
        {DWXColor(64, 64, 64), "DarkGray"},
        {DWXColor(196, 196, 196), "LightGray"},
        {DWXColor(192, 192, 192), "(RGB:192 192 192)"},
        {DWXColor(1, 2, 3), "(RGB:1 2 3)"},
        {DWXColor(), "Black"},
    };
    for (const auto& c : cases) {
        EXPECT_STREQ(c.color.GetName(), c.name);
    }
    EXPECT_STREQ(DWXColor(255, 0, 0).GetRGBName(), "(RGB:255 0 0)");
}

TEST(ColorTest, RgbTextIsReadWhenItHoldsThreeNumbers) {
    const struct {
        const char* text;
        bool ok;
        int red, green, blue;
    } cases[] = {
        {"(RGB:10 20 30)", true, 10, 20, 30},
        {"RGB:10 20 30", true, 10, 20, 30},
        {"colour RGB:  1\t2 3 4", true, 1, 2, 3},
        {"RGB:300 -1 0", true, 44, 255, 0},
        {"RGB:99999999999 1 2", true, 255, 1, 2},  // beyond int: still the low byte
        {"RGB:a b c", true, 0, 0, 0},
        {"rgb:10 20 30", false, 0, 0, 0},
        {"RGB:10 20", false, 0, 0, 0},
        {"RGB:", false, 0, 0, 0},
        {"", false, 0, 0, 0},
        {"NoSuchColour", false, 0, 0, 0},
        {nullptr, false, 0, 0, 0},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.text ? c.text : "(null)");
        DWXColor color(7, 8, 9, 10);
        EXPECT_EQ(color.SetByName(c.text), c.ok);
        if (c.ok) {
            ExpectArgb(color, {255, c.red, c.green, c.blue});
        } else {
            ExpectArgb(color, {7, 8, 9, 10});
        }
    }
}

TEST(ColorTest, SetByNameOfGetNameRestoresEveryColour) {
    for (int red = 0; red < 256; red += 15) {
        for (int green = 0; green < 256; green += 17) {
            for (int blue = 0; blue < 256; blue += 51) {
                const DWXColor source(3, red, green, blue);
                DWXColor back;
                ASSERT_TRUE(back.SetByName(source.GetName()));
                ASSERT_EQ(back, DWXColor(red, green, blue)) << source.GetName();
            }
        }
    }
}

// The registry is process-wide, so its whole story is told in one test that
// leaves it as the others expect it.
TEST(ColorTest, RegistryStartsWithTheDisplayTableAndGrowsInOrder) {
    std::vector<std::string> expected;
    for (const TableRow& row : kTable) {
        expected.push_back(row.display);
    }
    EXPECT_EQ(NamedColors(), expected);

    // The names handed out are the registry's own, the same on every call.
    char** first = GetNamedColors();
    char** second = GetNamedColors();
    EXPECT_EQ(first[0], second[0]);
    EXPECT_EQ(first[13], nullptr);
    free(first);
    free(second);

    AddNamedColor("Sky", DWXColor(0, 1, 2, 3));
    expected.push_back("Sky");
    EXPECT_STREQ(DWXColor(1, 2, 3).GetName(), "Sky");
    DWXColor sky;
    EXPECT_TRUE(sky.SetByName("sKY"));
    ExpectArgb(sky, {255, 1, 2, 3});

    // An update under another case keeps the stored name and its place.
    AddNamedColor("RED", DWXColor(9, 9, 9));
    AddNamedColor("sky", DWXColor(4, 5, 6));
    AddNamedColor(nullptr, DWXColor(1, 1, 1));
    EXPECT_EQ(NamedColors(), expected);
    DWXColor red;
    EXPECT_TRUE(red.SetByName("Red"));
    ExpectArgb(red, {255, 9, 9, 9});
    EXPECT_STREQ(DWXColor(255, 0, 0).GetName(), "(RGB:255 0 0)");
    EXPECT_STREQ(DWXColor(4, 5, 6).GetName(), "Sky");
    EXPECT_STREQ(DWXColor(1, 2, 3).GetName(), "(RGB:1 2 3)");

    // Registered names are searched before the RGB text and the built-in names.
    AddNamedColor("Grey", DWXColor(1, 1, 1));
    AddNamedColor("RGB:1 2 3", DWXColor(7, 7, 7));
    expected.push_back("Grey");
    expected.push_back("RGB:1 2 3");
    EXPECT_EQ(NamedColors(), expected);
    DWXColor color;
    EXPECT_TRUE(color.SetByName("grey"));
    ExpectArgb(color, {255, 1, 1, 1});
    EXPECT_TRUE(color.SetByName("RGB:1 2 3"));
    ExpectArgb(color, {255, 7, 7, 7});

    AddNamedColor("Red", DWXColor(255, 0, 0));
    AddNamedColor("Grey", DWXColor(128, 128, 128));
    EXPECT_STREQ(DWXColor(128, 128, 128).GetName(), "Gray");
    EXPECT_STREQ(DWXColor(255, 0, 0).GetName(), "Red");
}

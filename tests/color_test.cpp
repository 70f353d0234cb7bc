// Colours: components as bytes, the names a colour is set by and gives, and
// the process-wide registry of names.
#include <dwxcore/dwxcolor.h>

#include <gtest/gtest.h>

#include <stdlib.h>

#include <string>

namespace {

std::string Argb(const DWXColor& c) {
    return std::to_string(c.GetAlpha()) + " " + std::to_string(c.GetRed()) + " " +
           std::to_string(c.GetGreen()) + " " + std::to_string(c.GetBlue());
}

std::string NamedColors() {
    char** names = GetNamedColors();
    std::string joined;
    for (char** name = names; *name != nullptr; ++name) {
        joined += std::string(*name) + " ";
    }
    free(names);
    return joined;
}

// The registry starts with the display names, which write Gray for Grey.
const std::string kDisplayNames =
    "White Red Green Blue Yellow Black Orange Magenta Cyan Gray DarkGray LightGray Pink ";

}  // namespace

TEST(ColorTest, ComponentsAreBytesAndAlphaTakesPart) {
    EXPECT_EQ(Argb(DWXColor()), "0 0 0 0");
    EXPECT_EQ(Argb(DWXColor(300, -1, 0)), "255 44 255 0");
    EXPECT_EQ(Argb(DWXColor(256, 511, -256, 1000)), "0 255 0 232");
    EXPECT_NE(DWXColor(), DWXColor(0, 0, 0));  // alpha takes part
    EXPECT_FALSE(DWXColor(1, 2, 3) != DWXColor(255, 1, 2, 3));
}

// Names in either spelling (Grey, Gray) and any case, or RGB text with three
// numbers (one beyond int still gives its low byte; "RGB:" is case-sensitive);
// anything else leaves the colour as it was.
TEST(ColorTest, SetByNameAndGetName) {
    const char* cases[][2] = {{"GREY", "255 128 128 128"},
                              {"darkgray", "255 64 64 64"},
                              {"LightGrey", "255 196 196 196"},
                              {"oRANGE", "255 255 128 0"},
                              {"(RGB:10 20 30)", "255 10 20 30"},
                              {"colour RGB:  1\t2 3 4", "255 1 2 3"},
                              {"RGB:99999999999 1 2", "255 255 1 2"},
                              {"rgb:10 20 30", "7 8 9 10"},
                              {"RGB:10 20", "7 8 9 10"},
                              {"NoSuchColour", "7 8 9 10"},
                              {nullptr, "7 8 9 10"}};
    for (const auto& c : cases) {
        DWXColor color(7, 8, 9, 10);
        EXPECT_EQ(color.SetByName(c[0]), c[1][0] == '2') << (c[0] ? c[0] : "null");
        EXPECT_EQ(Argb(color), c[1]) << (c[0] ? c[0] : "null");
    }
    // The first display name with those components, alpha ignored.
    EXPECT_STREQ(DWXColor(0, 255, 0, 0).GetName(), "Red");
    EXPECT_STREQ(DWXColor(255, 0, 255).GetName(), "Magenta");  // not Pink
    EXPECT_STREQ(DWXColor(128, 128, 128).GetName(), "Gray");
    EXPECT_STREQ(DWXColor(1, 2, 3).GetName(), "(RGB:1 2 3)");
}

// The registry is process-wide: its story is told in one test that leaves it
// as the other tests expect it.
TEST(ColorTest, RegistryStartsWithTheDisplayNamesAndGrowsInOrder) {
    EXPECT_EQ(NamedColors(), kDisplayNames);
    AddNamedColor("Sky", DWXColor(0, 1, 2, 3));
    AddNamedColor("RED", DWXColor(9, 9, 9));  // updates Red, keeps its spelling
    AddNamedColor(nullptr, DWXColor(1, 1, 1));
    AddNamedColor("Grey", DWXColor(1, 1, 1));  // registry before built-in names
    EXPECT_EQ(NamedColors(), kDisplayNames + "Sky Grey ");

    DWXColor color;
    EXPECT_TRUE(color.SetByName("sKY") && Argb(color) == "255 1 2 3");
    EXPECT_STREQ(color.GetName(), "Sky");
    EXPECT_TRUE(color.SetByName("Red") && Argb(color) == "255 9 9 9");
    EXPECT_TRUE(color.SetByName("grey") && Argb(color) == "255 1 1 1");
    EXPECT_STREQ(DWXColor(255, 0, 0).GetName(), "(RGB:255 0 0)");

    AddNamedColor("Red", DWXColor(255, 0, 0));
    AddNamedColor("Grey", DWXColor(128, 128, 128));
    EXPECT_STREQ(DWXColor(255, 0, 0).GetName(), "Red");
    EXPECT_STREQ(DWXColor(128, 128, 128).GetName(), "Gray");
}

// Colour preferences through a host's store (shared with the colour fuzz
// target), and the parse tree's preference model, whose file must give back
// what it stored.
#include "container_test_util.h"

#include "../fuzz/pref_models.h"

#include <gtest/gtest.h>

#include <memory>

namespace {

std::string Read(DWXColorPreferenceFormat& format, DWXColor* defaultColor, const char* key) {
    std::unique_ptr<DWXColor> c(format.GetPreference(defaultColor, key));
    return c ? std::to_string(c->GetAlpha()) + " " + std::to_string(c->GetRed()) + " " +
                   std::to_string(c->GetGreen()) + " " + std::to_string(c->GetBlue())
             : "null";
}

bool Store(DWXColorPreferenceFormat& format, const char* key, DWXColor* color) {
    return format.SetPreference(key, reinterpret_cast<char*>(&color));
}

}  // namespace

TEST(ColorPreferenceTest, StoresRedGreenBlueAsCommaText) {
    MapModel model;
    DWXColorPreferenceFormat format(&model), copy(format), assigned(nullptr);
    assigned = copy;  // copies share the model
    DWXColor odd(0, 300, -1, 7);
    EXPECT_TRUE(Store(assigned, "Odd", &odd));
    EXPECT_EQ(model.oTexts["Odd"], "44,255,7");
    EXPECT_FALSE(Store(format, "Other", nullptr) || format.SetPreference("Other", nullptr));
    model.bAccept = false;  // the model's answer is passed on
    EXPECT_FALSE(Store(format, "Other", &odd));
    EXPECT_EQ(model.oTexts.count("Other"), 0u);

    // Without a model the default is copied and nothing stored.
    DWXColorPreferenceFormat none(nullptr);
    std::unique_ptr<DWXColor> color(none.GetPreference(&odd, "Odd"));
    ASSERT_TRUE(color && color.get() != &odd && *color == odd);
    EXPECT_EQ(Read(none, nullptr, "Odd"), "null");
    EXPECT_FALSE(Store(none, "Odd", &odd));
}

TEST(ColorPreferenceTest, ReadsTheKeyThenComponentKeysThenTheDefault) {
    MapModel model;
    model.oTexts = {{"Line", "10,20,30"},    {"Wide", "300,256,-1"},   {"Words", "a,b,c"},
                    {"ShortColor", "10,20"}, {"LongColor", "1,2,3,4"}, {"HalfRedColor", "1"},
                    {"HalfBlueColor", "3"}};
    for (const std::string prefix : {"", "Back", "Short", "Long", "Color"}) {
        model.oTexts[prefix + "RedColor"] = "1";
        model.oTexts[prefix + "GreenColor"] = "2";
        model.oTexts[prefix + "BlueColor"] = "300";
    }
    DWXColorPreferenceFormat format(&model);
    std::string found;
    for (const char* key : {"Line", "Wide", "Words", "Color", "BackColor"}) {
        found += Read(format, nullptr, key) + "|";
    }
    EXPECT_EQ(found, "255 10 20 30|255 44 0 255|255 0 0 0|255 1 2 44|255 1 2 44|");
    // Malformed text never leads to the component keys; HalfColor lacks one;
    // in ColorColor the first "Color" is not the end.
    DWXColor fallback(0, 9, 9, 9);
    for (const char* key : std::initializer_list<const char*>{
             "ShortColor", "LongColor", "HalfColor", "ColorColor", "Back", "color", "", nullptr}) {
        EXPECT_EQ(Read(format, &fallback, key), "0 9 9 9") << (key ? key : "null");
        EXPECT_EQ(Read(format, nullptr, key), "null");
    }

    // All three component keys are looked up before any is tested, and each text
    // is read at once, so a model that reuses its buffer gives the right colour.
    model.oLookups.clear();
    model.bOneBuffer = true;
    EXPECT_EQ(Read(format, nullptr, "HalfColor"), "null");
    EXPECT_EQ(Read(format, nullptr, "BackColor"), "255 1 2 44");
    EXPECT_EQ(model.oLookups, (std::vector<std::string>{
                                  "HalfColor", "HalfRedColor", "HalfGreenColor", "HalfBlueColor",
                                  "BackColor", "BackRedColor", "BackGreenColor", "BackBlueColor"}));
}

TEST(PreferenceModelTest, StoresStringChildrenThatComeBackFromTheFile) {
    PTNSubTree tree("prefs");
    tree.AddChild(new PTNInteger("Width", 640));
    PTNPreferenceModel model(&tree), detached(nullptr);
    DWXColorPreferenceFormat format(&model);
    EXPECT_EQ(model.LookupPreference("Width"), nullptr);  // not a string child
    char text[] = "first";
    EXPECT_TRUE(model.StorePreference("Title", text));
    text[0] = 'F';  // the model keeps its own copy
    EXPECT_STREQ(model.LookupPreference("title"), "first");
    std::string wide = "wide", second = "second";  // TITLE replaces in place
    EXPECT_TRUE(model.StorePreference("Width", &wide[0]) &&
                model.StorePreference("TITLE", &second[0]));
    DWXColor fill(4, 5, 6);
    EXPECT_TRUE(Store(format, "FillColor", &fill));
    EXPECT_EQ(Captured([&](FILE* f) { tree.WriteToFile(f); }),
              "(prefs SubTree\n  (Width Integer 640)\n  (Title String \"second\")\n"
              "  (Width String \"wide\")\n  (FillColor String \"4,5,6\")\n)\n");
    EXPECT_FALSE(model.StorePreference(nullptr, text) || model.StorePreference("Key", nullptr) ||
                 detached.StorePreference("Key", text));
    EXPECT_TRUE(!model.LookupPreference(nullptr) && !detached.LookupPreference("Key"));

    // The fuzz corpus holds keys and texts the file would not give back; these
    // it would, and the model must not refuse them.
    for (const char* value :
         {"", "two words", "q\"uote", "line\nfeed", "back\\slash", "x)", "@menu Cancel", "a,b|c"}) {
        EXPECT_EQ(StoredAndReread("Text", value), value);
    }
    EXPECT_TRUE(StoredAndReread("", "1") == "(refused)" &&
                StoredAndReread("ctl\x01", "1") == "(refused)");
}

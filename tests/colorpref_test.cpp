#include <dwxcore/dwxcolorpref.h>

#include <gtest/gtest.h>

#include <map>
#include <memory>
#include <string>
#include <vector>

namespace {

// A host's store with case-sensitive keys and a record of every lookup. With
// bOneBuffer it hands every text out of one buffer that the next lookup overwrites.
class MapModel : public PreferenceModel {
  public:
    bool StorePreference(const char* key, char* text) override {
        if (bAccept)
            oTexts[key] = text;
        return bAccept;
    }
    const char* LookupPreference(const char* key) override {
        oLookups.push_back(key != nullptr ? key : "(null)");
        auto found = key != nullptr ? oTexts.find(key) : oTexts.end();
        if (found == oTexts.end())
            return nullptr;
        oBuffer = found->second;
        return bOneBuffer ? oBuffer.c_str() : found->second.c_str();
    }

    std::map<std::string, std::string> oTexts;
    std::vector<std::string> oLookups;
    std::string oBuffer;
    bool bAccept = true;
    bool bOneBuffer = false;
};

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
    DWXColorPreferenceFormat format(&model);
    DWXColor orange(0, 255, 128, 0), odd(300, -1, 7);
    EXPECT_TRUE(Store(format, "Fill", &orange));
    EXPECT_EQ(model.oTexts["Fill"], "255,128,0");
    EXPECT_TRUE(Store(format, "Odd", &odd));
    EXPECT_EQ(model.oTexts["Odd"], "44,255,7");

    model.bAccept = false;  // the model's answer is passed on
    EXPECT_FALSE(Store(format, "Other", &orange));
    model.bAccept = true;
    EXPECT_FALSE(Store(format, "Other", nullptr));
    EXPECT_FALSE(format.SetPreference("Other", nullptr));
    EXPECT_EQ(model.oTexts.count("Other"), 0u);

    DWXColorPreferenceFormat copy(format), assigned(nullptr);
    assigned = copy;  // copies share the model
    DWXColor stored(7, 200, 55, 100);
    ASSERT_TRUE(Store(copy, "Fill", &stored));
    EXPECT_EQ(Read(assigned, nullptr, "Fill"), "255 200 55 100");
}

TEST(ColorPreferenceTest, ReadsTheKeyThenComponentKeysThenTheDefault) {
    MapModel model;
    model.oTexts = {
        {"Line", "10,20,30"},     {"Wide", "300,256,-1"},   {"Words", "a,b,c"},
        {"ShortColor", "10,20"},  {"LongColor", "1,2,3,4"}, {"RedColor", "1"},
        {"GreenColor", "2"},      {"BlueColor", "300"},     {"BackRedColor", "4"},
        {"BackGreenColor", "5"},  {"BackBlueColor", "6"},   {"ShortRedColor", "7"},
        {"ShortGreenColor", "8"}, {"ShortBlueColor", "9"},  {"LongRedColor", "7"},
        {"LongGreenColor", "8"},  {"LongBlueColor", "9"},   {"HalfRedColor", "1"},
        {"HalfBlueColor", "3"},   {"ColorRedColor", "1"},   {"ColorGreenColor", "2"},
        {"ColorBlueColor", "3"},
    };
    const struct {
        const char* key;
        const char* expected;  // alpha red green blue; "default" for the fallback
    } cases[] = {
        {"Line", "255 10 20 30"},
        {"Wide", "255 44 0 255"},
        {"Words", "255 0 0 0"},
        {"Color", "255 1 2 44"},
        {"BackColor", "255 4 5 6"},
        {"ShortColor", "default"},  // malformed text never leads to the component keys
        {"LongColor", "default"},
        {"HalfColor", "default"},   // one component missing
        {"ColorColor", "default"},  // first "Color" is not the end
        {"Back", "default"},
        {"color", "default"},
        {"", "default"},
        {nullptr, "default"},
    };
    DWXColorPreferenceFormat format(&model);
    DWXColor fallback(0, 9, 9, 9);
    for (const auto& c : cases) {
        const bool isDefault = std::string(c.expected) == "default";
        EXPECT_EQ(Read(format, &fallback, c.key), isDefault ? "0 9 9 9" : c.expected)
            << (c.key ? c.key : "null");
        EXPECT_EQ(Read(format, nullptr, c.key) == "null", isDefault);
    }

    // All three component keys are looked up before any is tested, and each text
    // is read at once, so a model that reuses its buffer gives the right colour.
    model.oLookups.clear();
    model.bOneBuffer = true;
    EXPECT_EQ(Read(format, nullptr, "HalfColor"), "null");
    EXPECT_EQ(Read(format, nullptr, "BackColor"), "255 4 5 6");
    const std::vector<std::string> lookups = {"HalfColor",      "HalfRedColor", "HalfGreenColor",
                                              "HalfBlueColor",  "BackColor",    "BackRedColor",
                                              "BackGreenColor", "BackBlueColor"};
    EXPECT_EQ(model.oLookups, lookups);
}

TEST(ColorPreferenceTest, WithoutAModelTheDefaultIsCopiedAndNothingStored) {
    DWXColorPreferenceFormat format(nullptr);
    DWXColor fallback(0, 1, 2, 3);
    std::unique_ptr<DWXColor> color(format.GetPreference(&fallback, "Color"));
    ASSERT_TRUE(color && color.get() != &fallback && *color == fallback);
    EXPECT_EQ(format.GetPreference(nullptr, "Color"), nullptr);
    EXPECT_FALSE(Store(format, "Color", &fallback));
}

#include <dwxcore/dwxcolorpref.h>

#include <gtest/gtest.h>

#include <map>
#include <memory>
#include <string>
#include <vector>

namespace {

// A host's store: texts under case-sensitive keys, with a record of every lookup.
class MapModel : public PreferenceModel {
  public:
    bool StorePreference(const char* key, char* text) override {
        if (!bAccept) {
            return false;
        }
        oTexts[key] = text;
        return true;
    }
    const char* LookupPreference(const char* key) override {
        oLookups.push_back(key != nullptr ? key : "(null)");
        auto found = key != nullptr ? oTexts.find(key) : oTexts.end();
        return found != oTexts.end() ? found->second.c_str() : nullptr;
    }

    std::map<std::string, std::string> oTexts;
    std::vector<std::string> oLookups;
    bool bAccept = true;
};

// A store that hands every text out of one buffer, overwritten by the next lookup.
class OneBufferModel : public MapModel {
  public:
    const char* LookupPreference(const char* key) override {
        const char* text = MapModel::LookupPreference(key);
        if (text == nullptr) {
            return nullptr;
        }
        oBuffer = text;
        return oBuffer.c_str();
    }
    std::string oBuffer;
};

std::string Describe(const DWXColor* color) {
    if (color == nullptr) {
        return "null";
    }
    return std::to_string(color->GetAlpha()) + " " + std::to_string(color->GetRed()) + " " +
           std::to_string(color->GetGreen()) + " " + std::to_string(color->GetBlue());
}

std::string Read(DWXColorPreferenceFormat& format, DWXColor* defaultColor, const char* key) {
    std::unique_ptr<DWXColor> color(format.GetPreference(defaultColor, key));
    return Describe(color.get());
}

bool Store(DWXColorPreferenceFormat& format, const char* key, DWXColor* color) {
    return format.SetPreference(key, reinterpret_cast<char*>(&color));
}

}  // namespace

TEST(ColorPreferenceTest, StoresRedGreenBlueAsCommaText) {
    MapModel model;
    DWXColorPreferenceFormat format(&model);
    DWXColor orange(0, 255, 128, 0);
    EXPECT_TRUE(Store(format, "Fill", &orange));
    EXPECT_EQ(model.oTexts["Fill"], "255,128,0");

    DWXColor odd(300, -1, 7);
    EXPECT_TRUE(Store(format, "Fill", &odd));
    EXPECT_EQ(model.oTexts["Fill"], "44,255,7");

    // The model's answer is passed on; nothing is stored without a colour.
    model.bAccept = false;
    EXPECT_FALSE(Store(format, "Other", &orange));
    model.bAccept = true;
    EXPECT_FALSE(Store(format, "Other", nullptr));
    EXPECT_FALSE(format.SetPreference("Other", nullptr));
    EXPECT_EQ(model.oTexts.count("Other"), 0u);
}

TEST(ColorPreferenceTest, ReadsTheKeyThenComponentKeysThenTheDefault) {
    const std::map<std::string, std::string> store = {
        {"Line", "10,20,30"},          {"Wide", "300,256,-1"},       {"ShortColor", "10,20"},
        {"LongColor", "10,20,30,40"},  {"Words", "a,b,c"},           {"RedColor", "1"},
        {"GreenColor", "2"},           {"BlueColor", "300"},         {"BackgroundRedColor", "4"},
        {"BackgroundGreenColor", "5"}, {"BackgroundBlueColor", "6"}, {"ShortRedColor", "7"},
        {"ShortGreenColor", "8"},      {"ShortBlueColor", "9"},      {"LongRedColor", "7"},
        {"LongGreenColor", "8"},       {"LongBlueColor", "9"},       {"HalfRedColor", "1"},
        {"HalfBlueColor", "3"},        {"ColorRedColor", "1"},       {"ColorGreenColor", "2"},
        {"ColorBlueColor", "3"},
    };
    const struct {
        const char* key;
        const char* expected;  // alpha red green blue
    } cases[] = {
        {"Line", "255 10 20 30"},
        {"Wide", "255 44 0 255"},
        {"Words", "255 0 0 0"},
        // A malformed text never leads to the component keys.
        {"ShortColor", "0 9 9 9"},
        {"LongColor", "0 9 9 9"},
        {"Color", "255 1 2 44"},
        {"BackgroundColor", "255 4 5 6"},
        {"HalfColor", "0 9 9 9"},   // one component missing
        {"ColorColor", "0 9 9 9"},  // its first "Color" does not end the key
        {"Background", "0 9 9 9"},
        {"ForegroundColor", "0 9 9 9"},
        {"color", "0 9 9 9"},
        {"", "0 9 9 9"},
        {nullptr, "0 9 9 9"},
    };
    MapModel model;
    model.oTexts = store;
    DWXColorPreferenceFormat format(&model);
    DWXColor fallback(0, 9, 9, 9);
    for (const auto& c : cases) {
        SCOPED_TRACE(c.key ? c.key : "(null)");
        EXPECT_EQ(Read(format, &fallback, c.key), c.expected);
        if (std::string(c.expected) == "0 9 9 9") {
            EXPECT_EQ(Read(format, nullptr, c.key), "null");
        }
    }
}

TEST(ColorPreferenceTest, LooksUpAllThreeComponentKeysBeforeAnyTest) {
    MapModel model;
    model.oTexts["BackgroundBlueColor"] = "1";
    DWXColorPreferenceFormat format(&model);
    EXPECT_EQ(Read(format, nullptr, "BackgroundColor"), "null");
    const std::vector<std::string> expected = {"BackgroundColor", "BackgroundRedColor",
                                               "BackgroundGreenColor", "BackgroundBlueColor"};
    EXPECT_EQ(model.oLookups, expected);

    model.oLookups.clear();
    Read(format, nullptr, "ColorColor");
    EXPECT_EQ(model.oLookups, std::vector<std::string>{"ColorColor"});
    model.oLookups.clear();
    Read(format, nullptr, nullptr);
    EXPECT_EQ(model.oLookups, std::vector<std::string>{"(null)"});
}

TEST(ColorPreferenceTest, ComponentsSurviveAModelThatReusesItsBuffer) {
    OneBufferModel model;
    model.oTexts = {{"PenRedColor", "11"}, {"PenGreenColor", "22"}, {"PenBlueColor", "33"}};
    DWXColorPreferenceFormat format(&model);
    EXPECT_EQ(Read(format, nullptr, "PenColor"), "255 11 22 33");
}

TEST(ColorPreferenceTest, WithoutAModelTheDefaultIsCopiedAndNothingStored) {
    DWXColorPreferenceFormat format(nullptr);
    DWXColor fallback(0, 1, 2, 3);
    std::unique_ptr<DWXColor> color(format.GetPreference(&fallback, "Color"));
    ASSERT_NE(color, nullptr);
    EXPECT_NE(color.get(), &fallback);
    EXPECT_EQ(*color, fallback);
    EXPECT_EQ(format.GetPreference(nullptr, "Color"), nullptr);
    EXPECT_FALSE(Store(format, "Color", &fallback));
}

TEST(ColorPreferenceTest, StoredColoursReadBackWithAlpha255AndCopiesShareTheModel) {
    MapModel model;
    DWXColorPreferenceFormat format(&model);
    DWXColorPreferenceFormat copy(format);
    DWXColorPreferenceFormat assigned(nullptr);
    assigned = format;

    for (int value = 0; value < 256; value += 5) {
        DWXColor stored(value % 7, value, 255 - value, value / 2);
        ASSERT_TRUE(Store(copy, "Fill", &stored));
        std::unique_ptr<DWXColor> back(assigned.GetPreference(nullptr, "Fill"));
        ASSERT_NE(back, nullptr);
        EXPECT_EQ(*back, DWXColor(value, 255 - value, value / 2));
    }
}

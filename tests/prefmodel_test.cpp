#include <dwxcore/dwxcolorpref.h>
#include <dwxcore/dwxprefmodel.h>

#include <gtest/gtest.h>

#include <stdio.h>
#include <stdlib.h>

#include <memory>
#include <string>

namespace {

std::string WrittenText(const PTNSubTree& tree) {
    char* buffer = nullptr;
    size_t size = 0;
    FILE* stream = open_memstream(&buffer, &size);
    tree.WriteToFile(stream);
    fclose(stream);
    std::string text(buffer, size);
    free(buffer);
    return text;
}

bool Store(PreferenceModel& model, const char* key, const char* text) {
    std::string copy = text;
    return model.StorePreference(key, &copy[0]);
}

bool StoreColor(DWXColorPreferenceFormat& format, const char* key, DWXColor color) {
    DWXColor* pointer = &color;
    return format.SetPreference(key, reinterpret_cast<char*>(&pointer));
}

}  // namespace

TEST(PreferenceModelTest, StoresCopiesAsStringChildrenAndUpdatesInPlace) {
    PTNSubTree tree("prefs");
    PTNPreferenceModel model(&tree);
    EXPECT_EQ(model.GetTree(), &tree);
    EXPECT_EQ(model.LookupPreference("Title"), nullptr);

    char text[] = "first";
    EXPECT_TRUE(model.StorePreference("Title", text));
    text[0] = 'F';  // the model keeps its own copy
    EXPECT_STREQ(model.LookupPreference("title"), "first");
    EXPECT_TRUE(Store(model, "Size", "12"));
    EXPECT_TRUE(Store(model, "TITLE", "second"));

    EXPECT_EQ(tree.GetChildren()->GetCount(), 2);
    EXPECT_STREQ(tree.GetChild("Title", "PTNString")->GetName(), "Title");
    EXPECT_STREQ(tree.GetChildAsString("Title"), "second");
    EXPECT_EQ(WrittenText(tree),
              "(prefs SubTree\n"
              "  (Title String \"second\")\n"
              "  (Size String \"12\")\n"
              ")\n");
}

TEST(PreferenceModelTest, LeavesChildrenOfOtherClassesAlone) {
    PTNSubTree tree("prefs");
    tree.AddChild(new PTNInteger("Width", 640));
    PTNPreferenceModel model(&tree);
    EXPECT_EQ(model.LookupPreference("Width"), nullptr);
    EXPECT_TRUE(Store(model, "Width", "wide"));
    EXPECT_STREQ(model.LookupPreference("Width"), "wide");
    EXPECT_EQ(tree.GetChildAsInteger("Width"), 640);
}

TEST(PreferenceModelTest, RefusesWhatWouldNotComeBackFromAFile) {
    PTNSubTree tree("prefs");
    PTNPreferenceModel model(&tree);
    const char* badKeys[] = {"",        "two words", "tab\there",   "quo\"te",
                             "ctl\x01", "@include",  "@TRY_INCLUDE"};
    for (const char* key : badKeys) {
        EXPECT_FALSE(Store(model, key, "1")) << key;
    }
    EXPECT_FALSE(model.StorePreference(nullptr, nullptr));
    EXPECT_FALSE(model.StorePreference("Key", nullptr));
    EXPECT_FALSE(Store(model, "Key", "@@Cancel"));
    EXPECT_FALSE(Store(model, "Key", "@menu:Cancel"));
    EXPECT_FALSE(Store(model, "Key", "_(Hello)"));
    EXPECT_FALSE(Store(model, "Key", "MkTokenString(a,b)"));
    EXPECT_EQ(tree.GetChildren()->GetCount(), 0);
    EXPECT_EQ(model.LookupPreference(nullptr), nullptr);

    PTNPreferenceModel detached(nullptr);
    EXPECT_FALSE(Store(detached, "Key", "1"));
    EXPECT_EQ(detached.LookupPreference("Key"), nullptr);
}

TEST(PreferenceModelTest, ColoursAreWrittenAsTheirPreferenceText) {
    PTNSubTree tree("prefs");
    PTNPreferenceModel model(&tree);
    DWXColorPreferenceFormat format(&model);
    EXPECT_TRUE(StoreColor(format, "FillColor", DWXColor(255, 128, 0)));
    EXPECT_TRUE(StoreColor(format, "LineColor", DWXColor(0, 1, 2, 3)));
    EXPECT_TRUE(StoreColor(format, "fillcolor", DWXColor(4, 5, 6)));
    EXPECT_FALSE(StoreColor(format, "Bad Color", DWXColor(4, 5, 6)));
    EXPECT_EQ(WrittenText(tree),
              "(prefs SubTree\n"
              "  (FillColor String \"4,5,6\")\n"
              "  (LineColor String \"1,2,3\")\n"
              ")\n");

    // Component keys stored by a host are found the same way.
    EXPECT_TRUE(Store(model, "PenRedColor", "10"));
    EXPECT_TRUE(Store(model, "PenGreenColor", "20"));
    EXPECT_TRUE(Store(model, "PenBlueColor", "30"));
    std::unique_ptr<DWXColor> pen(format.GetPreference(nullptr, "PenColor"));
    ASSERT_NE(pen, nullptr);
    EXPECT_EQ(*pen, DWXColor(10, 20, 30));
}

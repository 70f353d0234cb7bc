#include "container_test_util.h"

#include <dwxcore/dwxcolorpref.h>
#include <dwxcore/dwxprefmodel.h>

#include <gtest/gtest.h>

#include <stdio.h>
#include <stdlib.h>
#include <unistd.h>

#include <memory>
#include <string>

namespace {

bool Store(PreferenceModel& model, const char* key, std::string text) {
    return model.StorePreference(key, &text[0]);
}

bool StoreColor(DWXColorPreferenceFormat& format, const char* key, DWXColor color) {
    DWXColor* pointer = &color;
    return format.SetPreference(key, reinterpret_cast<char*>(&pointer));
}

}  // namespace

TEST(PreferenceModelTest, StoresCopiesAsStringChildrenAndUpdatesInPlace) {
    PTNSubTree tree("prefs");
    tree.AddChild(new PTNInteger("Width", 640));
    PTNPreferenceModel model(&tree);
    DWXColorPreferenceFormat format(&model);
    EXPECT_EQ(model.LookupPreference("Title"), nullptr);
    EXPECT_EQ(model.LookupPreference("Width"), nullptr);  // not a string child

    char text[] = "first";
    EXPECT_TRUE(model.StorePreference("Title", text));
    text[0] = 'F';  // the model keeps its own copy
    EXPECT_STREQ(model.LookupPreference("title"), "first");
    EXPECT_TRUE(Store(model, "Width", "wide"));
    EXPECT_TRUE(Store(model, "TITLE", "second"));
    EXPECT_TRUE(StoreColor(format, "FillColor", DWXColor(0, 1, 2, 3)));
    EXPECT_TRUE(StoreColor(format, "fillcolor", DWXColor(4, 5, 6)));
    EXPECT_EQ(tree.GetChildAsInteger("Width"), 640);
    EXPECT_EQ(Captured([&](FILE* f) { tree.WriteToFile(f); }),
              "(prefs SubTree\n"
              "  (Width Integer 640)\n"
              "  (Title String \"second\")\n"
              "  (Width String \"wide\")\n"
              "  (FillColor String \"4,5,6\")\n"
              ")\n");
}

TEST(PreferenceModelTest, RefusesWhatWouldNotComeBackFromAFile) {
    PTNSubTree tree("prefs");
    PTNPreferenceModel model(&tree), detached(nullptr);
    for (const char* key :
         {"", "two words", "tab\there", "quo\"te", "ctl\x01", "@include", "@TRY_INCLUDE"}) {
        EXPECT_FALSE(Store(model, key, "1")) << key;
    }
    for (const char* text : {"@@Cancel", "@menu:Cancel", " _(Hello)", "MkTokenString(a,b)"}) {
        EXPECT_FALSE(Store(model, "Key", text)) << text;
    }
    EXPECT_FALSE(model.StorePreference(nullptr, nullptr));
    EXPECT_FALSE(model.StorePreference("Key", nullptr));
    EXPECT_FALSE(Store(detached, "Key", "1"));
    EXPECT_EQ(tree.GetChildren()->GetCount(), 0);
    EXPECT_EQ(model.LookupPreference(nullptr), nullptr);
    EXPECT_EQ(detached.LookupPreference("Key"), nullptr);
}

TEST(PreferenceModelTest, ColoursAndTextsComeBackFromAWrittenFile) {
    const char* texts[] = {"",   "two words",    "q\"uote", "line\nfeed", "back\\slash",
                           "x)", "@menu Cancel", "a,b|c"};
    char path[] = "/tmp/prefmodel_testXXXXXX";
    const int fd = mkstemp(path);
    ASSERT_GE(fd, 0);
    {
        PTNSubTree tree("prefs");
        PTNPreferenceModel model(&tree);
        DWXColorPreferenceFormat format(&model);
        ASSERT_TRUE(StoreColor(format, "FillColor", DWXColor(0, 255, 128, 0)));
        for (int i = 0; i < 8; ++i) {
            ASSERT_TRUE(Store(model, ("Text" + std::to_string(i)).c_str(), texts[i]));
        }
        FILE* out = fdopen(fd, "w");
        tree.WriteToFile(out);
        fclose(out);
    }
    PTNSubTree root("root");
    FILE* in = DKOpen(path, 4, "r");
    ASSERT_NE(in, nullptr);
    root.BuildFromFile(in);
    DKClose(in);
    remove(path);
    PTNPreferenceModel model(static_cast<PTNSubTree*>(root.GetChild("prefs", "PTNSubTree")));
    DWXColorPreferenceFormat format(&model);
    std::unique_ptr<DWXColor> fill(format.GetPreference(nullptr, "FillColor"));
    ASSERT_TRUE(fill);
    EXPECT_EQ(*fill, DWXColor(255, 128, 0));
    for (int i = 0; i < 8; ++i) {
        EXPECT_STREQ(model.LookupPreference(("text" + std::to_string(i)).c_str()), texts[i]);
    }
}

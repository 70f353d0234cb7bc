// The same answers under the locales hosts set with setlocale: names compare
// ASCII letters only and numbers are read and written as in the "C" locale,
// whatever LC_CTYPE and LC_NUMERIC say. The locales are compiled into the
// build tree by the make_test_locales fixture and found through LOCPATH; a
// locale that cannot be set fails the test.
#include "container_test_util.h"
#include "tree_test_util.h"

#include <dwxcore/dwxcmdline.h>
#include <dwxcore/dwxcolor.h>
#include <dwxcore/dwxcurrentfinder.h>
#include <dwxcore/dwxparse.h>
#include <dwxcore/dwxstring.h>
#include <services/rtprim.h>
#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <ctype.h>
#include <locale.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <sstream>
#include <string>
#include <utility>

namespace {

// Everything a host asks whose answer hangs on names or numbers, a line per
// family. C++ streams keep the classic locale whatever setlocale says. Byte
// 0xDD is the dotted capital I of ISO-8859-9, which that locale folds to 'i'.
std::string Ask() {
    std::ostringstream out;
    PTNSubTree names("root");
    names.AddChild(new PTNInteger("title", 7));
    names.AddChild(new PTNInteger("item", 8));
    DWXColor colour;
    out << "children " << names.GetChildAsInteger("TITLE") << names.GetChildAsInteger("\xDDTEM")
        << (names.GetChild("TITLE", "PTNINTEGER") != nullptr) << "\ncolours "
        << colour.SetByName("WHITE") << colour.SetByName("L\xDDGHTGREY");
    DWXCmdLine options("prog -Title 5 -\xDD 6 -f 2.5e1");
    ExceptionList exceptions;
    exceptions.Add("TITLE");
    DWXString title("title");
    out << "\noptions " << options.GetInt("-TITLE", -1) << options.Exist("-i") << " "
        << options.GetFloat("-f", 0) << "\nexceptions " << exceptions.IsMember("title")
        << exceptions.IsMember("t\xDDtle") << "\nstring " << title.CompareNoCase("TITLE") << " "
        << static_cast<const char*>(title.MakeUpper()) << " " << DWXString(" 2.5e1").ToDouble()
        << "\nvalidate ";
    for (const char* name : {"ITEM", "\xDDtem"}) {
        FILE* stream = fmemopen(const_cast<char*>("(item SUBTREE\n)\n"), 16, "r");
        out << PTNSubTree::PTNValidateFile(stream, name);
        fclose(stream);
    }
    PTNSubTree read("read");
    read.BuildFromString(
        "(t INTEGER 3)\n(@INCLUDE /dev/null)\n(@TRY_INCLUDE /nonexistent)\n"
        "(s SUBTREE\n(c CHAR x)\n)\n");
    out << "\nkeywords and directives " << Shape(&read, true);
    // A table kept from call to call: filled under "C", then used and changed
    // under each locale.
    static CurrentFinder<DWXObject> table;
    for (const char* member : {"item", "Title", "\xDDtem"}) {
        table.SetCurrent(member, new PTNInteger(member, 0));
    }
    out << "\ntable";
    for (const char* member : {"ITEM", "title", "\xDDTEM", "\xFDtem"}) {
        const DWXParseTreeNode* found = static_cast<PTNInteger*>(table.GetCurrent(member));
        out << " " << (found ? found->GetName() : "-");
    }
    setenv("DWX_LOCALE_NAME", "value", 1);
    out << "\nexpand " << HeapText(HStringExpand("$DWX_LOCALE_NAME\xDD")).get();

    // Numbers, written and read back, and set from text node by node.
    PTNSubTree numbers("numbers");
    numbers.AddChild(new PTNDouble("tiny", 1.25e-07));
    numbers.AddChild(new PTNFloat("f", 2.5f));
    const double pair[] = {0.5, 3.25e-09};
    numbers.AddChild(new PTNDoubleList("dl", 2, pair));
    const std::string written = Captured([&](FILE* f) { numbers.WriteToFile(f); });
    PTNSubTree again("again");
    again.BuildFromString((written + "(b Double 2.5e0)\n").c_str());
    out << "\nwritten " << written << "read back " << Shape(&again, true) << "\nnodes";
    auto set = [&out](auto&& node, const char* text) {
        node.SetAsString(text);
        out << " " << node.GetClassName() << "=" << Text(node);
    };
    set(PTNFloat("f", 0), "2.5e1");
    set(PTNDouble("d", 0), "1.25e-07");
    set(PTNInteger32List("tl", 0, nullptr), "2.5e1 -1.75");
    set(PTNDoubleList("dl", 0, nullptr), "0.5 3.25e-09");
    out << "\nScanDouble " << ScanDouble("2.5e1xyz", 5) << " MkName " << MkName(2.5, 2);
    return out.str();
}

// Puts the "C" locale back however the test ends.
struct RestoreCLocale {
    ~RestoreCLocale() { setlocale(LC_ALL, "C"); }
};

TEST(Locale, NamesAndNumbersGiveTheAnswersOfTheCLocale) {
    RestoreCLocale restore;
    ASSERT_NE(setlocale(LC_ALL, "C"), nullptr);
    const std::string expected = Ask();
    // A few answers of the "C" locale, so that the comparison rests on sound ground.
    EXPECT_EQ(expected.rfind("children 701\ncolours 10\noptions 50 25\n", 0), 0u) << expected;

    const char* locpath = getenv("LOCPATH");
    ASSERT_NE(locpath, nullptr) << "LOCPATH names the locales the fixture compiled";
    // Whether each locale is really in effect: the hazard the library must not
    // follow is present. The letters go through volatile, since an optimising
    // compiler may fold tolower of a constant the way the "C" locale answers it.
    static volatile int kCapitalI = 'I', kSmallI = 'i', kDottedCapitalI = 0xDD;
    const std::pair<const char*, bool (*)()> cases[] = {
        {"tr_TR.UTF-8", [] { return tolower(kCapitalI) != 'i'; }},
        {"tr_TR.ISO-8859-9",
         [] { return tolower(kDottedCapitalI) == 'i' && toupper(kSmallI) == 0xDD; }},
        {"de_DE.UTF-8", [] { return strcmp(localeconv()->decimal_point, ",") == 0; }},
    };
    for (const auto& [name, inEffect] : cases) {
        SCOPED_TRACE(name);
        ASSERT_NE(setlocale(LC_ALL, name), nullptr) << "not found under " << locpath;
        EXPECT_TRUE(inEffect());
        EXPECT_EQ(Ask(), expected);
    }
}

}  // namespace

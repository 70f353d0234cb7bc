// The same answers under the locales hosts set with setlocale: names compare
// ASCII letters only and numbers are read and written as in the "C" locale,
// whatever LC_CTYPE and LC_NUMERIC say. The locales are compiled into the
// build tree by the make_test_locales fixture and found through LOCPATH; a
// locale that cannot be set fails the test.
#include "container_test_util.h"
#include "scratch_dir.h"
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

#include <iomanip>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

namespace {

std::string Colour(const char* name) {
    DWXColor colour(1, 1, 1);
    const bool found = colour.SetByName(name);
    return std::to_string(found) + " " + std::to_string(colour.GetRed()) + " " +
           std::to_string(colour.GetGreen()) + " " + std::to_string(colour.GetBlue()) + ", ";
}

// A registry member that logs its name when deleted.
class Logged : public DWXObject {
  public:
    Logged(std::vector<std::string>& log, const char* name) : oLog(log), oName(name) {}
    ~Logged() override { oLog.push_back(oName); }
    const char* GetClassName() const override { return "Logged"; }

  private:
    std::vector<std::string>& oLog;
    std::string oName;
};

// Everything a host asks whose answer hangs on names or numbers, a line per
// family. C++ streams keep the classic locale whatever setlocale says. Byte
// 0xDD is the dotted capital I of ISO-8859-9, which that locale folds to 'i'.
std::string Ask(const ScratchDir& dir) {
    std::ostringstream out;
    out << std::setprecision(17);
    PTNSubTree names("root");
    names.AddChild(new PTNInteger("title", 7));
    names.AddChild(new PTNInteger("item", 8));
    out << "children " << names.GetChildAsInteger("TITLE") << names.GetChildAsInteger("\xDDTEM")
        << (names.GetChild("TITLE", "PTNINTEGER") != nullptr) << "\ncolours " << Colour("WHITE")
        << Colour("LIGHTGRAY") << Colour("L\xDDGHTGREY") << Colour("(RGB:10 20 300)");
    DWXCmdLine options("prog -Title 5 -\xDD 6");
    ExceptionList exceptions;
    exceptions.Add("TITLE");
    DWXString title("title");
    PTNBool yes("b", 0);
    yes.SetAsString("true");
    out << "\noptions " << options.GetInt("-TITLE", -1) << options.Exist("-i") << "\nexceptions "
        << exceptions.IsMember("title") << exceptions.IsMember("t\xDDtle") << "\nstring "
        << title.CompareNoCase("TITLE") << " " << static_cast<const char*>(title.MakeUpper())
        << "\nbool " << Text(yes) << "\nvalidate ";
    for (const char* name : {"ITEM", "\xDDtem"}) {
        FILE* stream = fmemopen(const_cast<char*>("(item SUBTREE\n)\n"), 16, "r");
        out << PTNSubTree::PTNValidateFile(stream, name);
        fclose(stream);
    }
    const std::string include = dir.Write("inc.cfg", "(inc INTEGER 5)\n");
    PTNSubTree read("read");
    try {
        read.BuildFromString(("(t INTEGER 3)\n(@INCLUDE " + include +
                              ")\n(@TRY_INCLUDE /nonexistent)\n(s SUBTREE\n(c CHAR x)\n)\n")
                                 .c_str());
        out << "\nkeywords and directives " << Shape(&read, true);
    } catch (const tzn::Exception& e) {
        out << "\nkeywords and directives threw " << e.what();
    }
    setenv("DWX_LOCALE_NAME", "value", 1);
    out << "\nexpand " << HeapText(HStringExpand("$DWX_LOCALE_NAME\xDD")).get();

    // Numbers, written and read back, and set from text node by node.
    PTNSubTree numbers("numbers");
    numbers.AddChild(new PTNDouble("tiny", 1.25e-07));
    numbers.AddChild(new PTNDouble("third", 1.0 / 3));
    numbers.AddChild(new PTNFloat("f", 2.5f));
    const double pair[] = {0.5, 3.25e-09};
    numbers.AddChild(new PTNDoubleList("dl", 2, pair));
    const int ints[] = {25, -3};
    numbers.AddChild(new PTNInteger32List("il", 2, ints));
    const std::string written = Captured([&](FILE* f) { numbers.WriteToFile(f); });
    PTNSubTree again("again");
    again.BuildFromString((written + "(b Double 2.5e0)\n").c_str());
    out << "\nwritten " << written << "read back " << Shape(&again, true) << " "
        << again.GetChildAsDouble("b") << "\nnodes";
    auto set = [&out](auto&& node, const char* text) {
        node.SetAsString(text);
        out << " " << node.GetClassName() << "=" << Text(node);
    };
    set(PTNInteger("i", 0), " 42x");
    set(PTNFloat("f", 0), "2.5e1");
    set(PTNDouble("d", 0), "1.25e-07");
    set(PTNIntegerList("il", 0, nullptr), "1 -2");
    set(PTNInteger32List("tl", 0, nullptr), "2.5e1 -1.75");
    set(PTNDoubleList("dl", 0, nullptr), "0.5 3.25e-09");
    DWXCmdLine command("prog -f 2.5e1 -n 7");
    out << "\nScanDouble " << ScanDouble("2.5e1xyz", 5) << " MkName " << MkName(2.5, 2)
        << "\ncommand line " << command.GetFloat("-f", 0) << " " << command.GetInt("-N", 0)
        << "\nDWXString " << DWXString(" 2.5e1").ToDouble() << " " << DWXString("42.5").ToInt();
    return out.str();
}

// Puts the "C" locale back however the test ends.
struct RestoreCLocale {
    ~RestoreCLocale() { setlocale(LC_ALL, "C"); }
};

TEST(Locale, NamesAndNumbersGiveTheAnswersOfTheCLocale) {
    ScratchDir dir;
    RestoreCLocale restore;
    ASSERT_NE(setlocale(LC_ALL, "C"), nullptr);
    const std::string expected = Ask(dir);
    // A few answers of the "C" locale, so that the comparison rests on sound ground.
    EXPECT_EQ(expected.rfind("children 701\ncolours 1 255 255 255, ", 0), 0u) << expected;

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
        EXPECT_EQ(Ask(dir), expected);

        // A table filled under one locale and used under another keeps its order.
        std::vector<std::string> log;
        {
            CurrentFinder<DWXObject> table;
            setlocale(LC_ALL, "C");
            for (const char* member : {"item", "Title", "\xDDtem", "Zeta"}) {
                table.SetCurrent(member, new Logged(log, member));
            }
            setlocale(LC_ALL, name);
            for (const char* member : {"idle", "Ibis"}) {
                table.SetCurrent(member, new Logged(log, member));
            }
            for (const char* member : {"ITEM", "title", "\xDDTEM", "zeta", "IDLE", "ibis"}) {
                EXPECT_NE(table.GetCurrent(member), nullptr) << member;
            }
            EXPECT_EQ(table.GetCurrent("\xFDtem"), nullptr);
        }
        EXPECT_EQ(log,
                  (std::vector<std::string>{"Ibis", "idle", "item", "Title", "Zeta", "\xDDtem"}));
    }
}

}  // namespace

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

#include <charconv>
#include <functional>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace {

using Answers = std::vector<std::pair<std::string, std::string>>;

// The shortest text of a double, the same in every locale.
std::string Number(double value) {
    char text[64];
    *std::to_chars(text, text + sizeof text - 1, value).ptr = '\0';
    return text;
}

std::string Heap(char* text) {
    std::string copy = text ? text : "(null)";
    free(text);
    return copy;
}

std::string Colour(const char* name) {
    DWXColor colour(1, 1, 1);
    bool found = colour.SetByName(name);
    return std::to_string(found) + " " + std::to_string(colour.GetRed()) + " " +
           std::to_string(colour.GetGreen()) + " " + std::to_string(colour.GetBlue());
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

// Everything a host asks whose answer hangs on names or numbers, as text.
Answers Ask(const ScratchDir& dir) {
    Answers answers;
    auto say = [&answers](const char* question, const std::string& answer) {
        answers.emplace_back(question, answer);
    };

    // Names. Byte 0xDD is the dotted capital I of ISO-8859-9, which that
    // locale folds to 'i'.
    PTNSubTree names("root");
    names.AddChild(new PTNInteger("title", 7));
    names.AddChild(new PTNInteger("item", 8));
    say("child TITLE", std::to_string(names.GetChildAsInteger("TITLE")));
    say("child \\xDDTEM", std::to_string(names.GetChildAsInteger("\xDDTEM")));
    say("typed child", std::to_string(names.GetChild("TITLE", "PTNINTEGER") != nullptr));
    say("colour WHITE", Colour("WHITE"));
    say("colour LIGHTGRAY", Colour("LIGHTGRAY"));
    say("colour L\\xDDGHTGREY", Colour("L\xDDGHTGREY"));
    say("colour RGB", Colour("(RGB:10 20 300)"));
    DWXCmdLine options("prog -Title 5 -\xDD 6");
    say("option -TITLE", std::to_string(options.GetInt("-TITLE", -1)));
    say("option -i", std::to_string(options.Exist("-i")));
    ExceptionList exceptions;
    exceptions.Add("TITLE");
    say("exception title", std::to_string(exceptions.IsMember("title")));
    say("exception t\\xDDtle", std::to_string(exceptions.IsMember("t\xDDtle")));
    DWXString title("title");
    say("CompareNoCase", std::to_string(title.CompareNoCase("TITLE")));
    say("MakeUpper", static_cast<const char*>(title.MakeUpper()));
    PTNBool yes("b", 0);
    yes.SetAsString("true");
    say("bool true", Heap(yes.GetAsString()));
    for (const char* name : {"ITEM", "\xDDtem"}) {
        FILE* stream = fmemopen(const_cast<char*>("(item SUBTREE\n)\n"), 16, "r");
        say("validate", std::to_string(PTNSubTree::PTNValidateFile(stream, name)));
        fclose(stream);
    }
    const std::string include = dir.Write("inc.cfg", "(inc INTEGER 5)\n");
    PTNSubTree read("read");
    std::string shape;
    try {
        read.BuildFromString(("(t INTEGER 3)\n(@INCLUDE " + include +
                              ")\n(@TRY_INCLUDE /nonexistent)\n(s SUBTREE\n(c CHAR x)\n)\n")
                                 .c_str());
        shape = Shape(&read, true);
    } catch (const tzn::Exception& e) {
        shape = std::string("threw: ") + e.what();
    }
    say("keywords and directives", shape);
    setenv("DWX_LOCALE_NAME", "value", 1);
    say("expand", Heap(HStringExpand("$DWX_LOCALE_NAME\xDD")));

    // Numbers, written and read back.
    PTNSubTree numbers("numbers");
    numbers.AddChild(new PTNDouble("tiny", 1.25e-07));
    numbers.AddChild(new PTNDouble("third", 1.0 / 3));
    numbers.AddChild(new PTNFloat("f", 2.5f));
    const double pair[] = {0.5, 3.25e-09};
    numbers.AddChild(new PTNDoubleList("dl", 2, pair));
    const int ints[] = {25, -3};
    numbers.AddChild(new PTNInteger32List("il", 2, ints));
    const std::string written = Captured([&](FILE* f) { numbers.WriteToFile(f); });
    say("written", written);
    PTNSubTree again("again");
    again.BuildFromString((written + "(b Double 2.5e0)\n").c_str());
    say("read back", Shape(&again, true));
    say("third", Number(again.GetChildAsDouble("third")));
    say("b", Number(again.GetChildAsDouble("b")));

    // Numbers set from text, node by node.
    PTNInteger integer("i", 0);
    PTNFloat single("f", 0);
    PTNDouble dbl("d", 0);
    PTNIntegerList integers("il", 0, nullptr);
    PTNInteger32List truncated("tl", 0, nullptr);
    PTNDoubleList doubles("dl", 0, nullptr);
    integer.SetAsString(" 42x");
    single.SetAsString("2.5e1");
    dbl.SetAsString("1.25e-07");
    integers.SetAsString("1 -2");
    truncated.SetAsString("2.5e1 -1.75");
    doubles.SetAsString("0.5 3.25e-09");
    for (const DWXParseTreeNode* node : std::vector<const DWXParseTreeNode*>{
             &integer, &single, &dbl, &integers, &truncated, &doubles}) {
        say(node->GetClassName(), Text(*node));
    }
    say("ScanDouble", Number(ScanDouble("2.5e1xyz", 5)));
    say("MkName", MkName(2.5, 2));
    DWXCmdLine command("prog -f 2.5e1 -n 7");
    say("GetFloat", Number(command.GetFloat("-f", 0)));
    say("GetInt", std::to_string(command.GetInt("-N", 0)));
    say("ToDouble", Number(DWXString(" 2.5e1").ToDouble()));
    say("ToInt", std::to_string(DWXString("42.5").ToInt()));
    return answers;
}

struct LocaleCase {
    const char* name;
    // Whether the locale is really in effect: the hazard the library must
    // not follow is present.
    std::function<bool()> inEffect;
};

// Puts the "C" locale back however the test ends.
struct RestoreCLocale {
    ~RestoreCLocale() { setlocale(LC_ALL, "C"); }
};

TEST(Locale, NamesAndNumbersGiveTheAnswersOfTheCLocale) {
    ScratchDir dir;
    RestoreCLocale restore;
    ASSERT_NE(setlocale(LC_ALL, "C"), nullptr);
    const Answers expected = Ask(dir);
    // A few answers of the "C" locale, so that the comparison rests on sound ground.
    EXPECT_EQ(expected[0].second, "7");
    EXPECT_EQ(expected[1].second, "0");
    EXPECT_EQ(expected[3].second, "1 255 255 255");

    const char* locpath = getenv("LOCPATH");
    ASSERT_NE(locpath, nullptr) << "LOCPATH names the locales the fixture compiled";
    const LocaleCase cases[] = {
        {"tr_TR.UTF-8", [] { return tolower('I') != 'i'; }},
        {"tr_TR.ISO-8859-9", [] { return tolower(0xDD) == 'i' && toupper('i') == 0xDD; }},
        {"de_DE.UTF-8", [] { return strcmp(localeconv()->decimal_point, ",") == 0; }},
    };
    for (const LocaleCase& c : cases) {
        SCOPED_TRACE(c.name);
        ASSERT_NE(setlocale(LC_ALL, c.name), nullptr) << "not found under " << locpath;
        EXPECT_TRUE(c.inEffect());
        const Answers answers = Ask(dir);
        ASSERT_EQ(answers.size(), expected.size());
        for (size_t i = 0; i < answers.size(); ++i) {
            EXPECT_EQ(answers[i], expected[i]);
        }

        // A table filled under one locale and used under another keeps its order.
        std::vector<std::string> log;
        {
            CurrentFinder<DWXObject> table;
            setlocale(LC_ALL, "C");
            for (const char* name : {"item", "Title", "\xDDtem", "Zeta"}) {
                table.SetCurrent(name, new Logged(log, name));
            }
            setlocale(LC_ALL, c.name);
            for (const char* name : {"idle", "Ibis"}) {
                table.SetCurrent(name, new Logged(log, name));
            }
            for (const char* name : {"ITEM", "title", "\xDDTEM", "zeta", "IDLE", "ibis"}) {
                EXPECT_NE(table.GetCurrent(name), nullptr) << name;
            }
            EXPECT_EQ(table.GetCurrent("\xFDtem"), nullptr);
        }
        EXPECT_EQ(log,
                  (std::vector<std::string>{"Ibis", "idle", "item", "Title", "Zeta", "\xDDtem"}));
    }
}

}  // namespace

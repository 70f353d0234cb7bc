// Separate objects on separate threads: every family at once from several
// threads, each thread with objects of its own, and the first use of the
// lazily made process-wide tables (named colours, the current-object
// registry, the exit list) made by those threads together. The tsan preset
// runs this under ThreadSanitizer; the answers are checked on every build.
#include "scratch_dir.h"
#include "tree_test_util.h"

#include <dwxcore/dwxcmdline.h>
#include <dwxcore/dwxcolor.h>
#include <dwxcore/dwxcolorpref.h>
#include <dwxcore/dwxcurrentfinder.h>
#include <dwxcore/dwxdate.h>
#include <dwxcore/dwxobject.h>
#include <dwxcore/dwxparse.h>
#include <dwxcore/dwxprefmodel.h>
#include <dwxcore/dwxstring.h>
#include <dwxcore/dwxtranslate.h>
#include <services/tracer.h>
#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <stdlib.h>

#include <atomic>
#include <memory>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

namespace {

constexpr int kThreads = 4;

class Item : public DWXObject {
  public:
    explicit Item(int value) : nValue(value) {}
    const char* GetClassName() const override { return "Item"; }
    int nValue;
};

std::atomic<int> gReports{0};
void CountReport(int, int, const char*) {
    ++gReports;
}

// Collects the first few mismatches of one thread.
class Check {
  public:
    template <typename A, typename B>
    void Equal(const A& got, const B& expected, const char* what) {
        if (!(got == expected) && oOut.tellp() < 2000) {
            oOut << what << ": got " << got << ", expected " << expected << "\n";
        }
    }
    std::string Text() const { return oOut.str(); }

  private:
    std::ostringstream oOut;
};

int SumOf(const DWXContainer& container) {
    int sum = 0;
    DWXIter it(&container);
    for (DWXObject* object = it.Start(); object; object = it.Next()) {
        sum += static_cast<Item*>(object)->nValue;
    }
    return sum;
}

void Containers(Check& check, int id) {
    DWXArray array;
    DWXPackedArray packed;
    DWXBag bag;
    DWXLinkedList list;
    DWXContainer* all[] = {&array, &packed, &bag, &list};
    for (DWXContainer* container : all) {
        for (int i = 1; i <= 10; ++i) {
            container->Add(new Item(id * 100 + i));
        }
        check.Equal(SumOf(*container), id * 1000 + 55, container->GetClassName());
        container->DestroyContents();
    }
}

void ParseTree(Check& check, int id, const std::string& file) {
    PTNSubTree tree("root");
    ReadFile(tree, file);
    auto* own = dynamic_cast<PTNSubTree*>(tree.GetChild("own"));
    check.Equal(own ? own->GetChildAsInteger("id") : -1, id, "id read");
    check.Equal(Shape(&tree), std::string("own{id common{shared}}"), "shape");

    std::unique_ptr<char, decltype(&free)> text(tree.GetAsString(), free);
    PTNSubTree again("again");
    again.BuildFromString(text.get());
    check.Equal(Shape(&again), "root{" + Shape(&tree) + "}", "write then read");

    FILE* stream = tmpfile();
    tree.WriteToFile(stream);
    check.Equal(PTNSubTree::PTNValidateFile(stream, "root"), 1, "validate");
    fclose(stream);

    const unsigned char bytes[] = {static_cast<unsigned char>(id), 0, 255, 'x'};
    check.Equal(base64_decode(base64_encode(bytes, 4)), std::string(bytes, bytes + 4), "base64");
}

void StringsAndCommandLine(Check& check, int id) {
    DWXString text = DWXFormat("thread %d", id) + DWXString(" of ") + DWXFormat("%d", kThreads);
    check.Equal(std::string(static_cast<const char*>(text)),
                "thread " + std::to_string(id) + " of " + std::to_string(kThreads), "string");
    std::string command = "prog -id " + std::to_string(id) + " -name t" + std::to_string(id);
    DWXCmdLine line(command.c_str());
    check.Equal(line.GetInt("-id", -1, 0), id, "command line");
    check.Equal(std::string(line.GetString("-NAME", "", 0)), "t" + std::to_string(id), "option");
}

void Colours(Check& check, int id) {
    DWXColor colour;
    check.Equal(colour.SetByName("orange"), true, "orange");
    check.Equal(colour.GetGreen(), 128, "orange green");
    check.Equal(std::string(DWXColor(255, 0, 0).GetName()), std::string("Red"), "name");
    DWXColor unnamed(id, 2, 3);
    check.Equal(std::string(unnamed.GetName()), "(RGB:" + std::to_string(id) + " 2 3)", "rgb");
    char** names = GetNamedColors();
    int count = 0;
    while (names[count]) {
        ++count;
    }
    free(names);
    check.Equal(count, 13, "named colours");

    PTNSubTree window("window");
    PTNPreferenceModel model(&window);
    DWXColorPreferenceFormat format(&model);
    DWXColor* stored = &unnamed;
    format.SetPreference("Fill", reinterpret_cast<char*>(&stored));
    std::unique_ptr<DWXColor> back(format.GetPreference(nullptr, "Fill"));
    check.Equal(back ? back->GetRed() : -1, id, "colour preference");
}

void DatesAndMapping(Check& check, int id) {
    DWXDate date(7, 4, 1776 + id);
    check.Equal(std::string(date.GetString()), "July 4, " + std::to_string(1776 + id), "date");
    date.addDay(1);
    check.Equal(std::string(date.GetString()), "July 5, " + std::to_string(1776 + id), "step");
    DWXDate invalid(13, 1, 2000);  // reported
    DWXDate today;
    today.SetToday();
    check.Equal(today.GetYear() > 2000, true, "today");

    DWXTranslate map;
    map.SetSrcRect(0, 0, 10, 10);
    map.SetDestRect(0, 0, 100 * id, 100);
    check.Equal(map.Src2DestX(5), 50.0 * id, "mapping");
}

void Registries(Check& check, int id, DWXCurrentFinder** singleton) {
    *singleton = GetDWXCurrentFinder();
    check.Equal((*singleton)->GetCurrent("nobody"), static_cast<DWXObject*>(nullptr), "registry");
    CurrentFinder<DWXObject> own;
    own.SetCurrent("doc", new Item(id));
    auto* doc = static_cast<Item*>(own.GetCurrent("DOC"));
    check.Equal(doc ? doc->nValue : -1, id, "own registry");
}

TEST(ThreadTest, SeparateObjectsOnSeparateThreads) {
    // Valgrind runs threads one at a time and slowly; a few rounds still walk
    // every path there.
    const int rounds = getenv("DWXCORE_UNDER_VALGRIND") ? 3 : 40;
    ScratchDir dir;
    std::string common = dir.Write("common.cfg", "(common SubTree\n  (shared Integer 1)\n)\n");
    std::vector<std::string> files;
    for (int id = 0; id < kThreads; ++id) {
        files.push_back(dir.Write("t" + std::to_string(id) + ".cfg",
                                  "(own SubTree\n  (id Integer " + std::to_string(id) +
                                      ")\n  (@include " + common + ")\n)\n"));
    }
    IMPErrorHandler previous = IMPSetErrorHandler(CountReport);
    DWXDate(13, 1, 2000);  // the reports of one invalid date
    const int reportsPerDate = gReports.exchange(0);
    // Includes are traced, to a stream that every thread writes to.
    FILE* trace = tmpfile();
    FILE* previousTrace = tzn::tracer::Debugger::SetStream(trace);
    tzn::tracer::Debugger::moDebugLevel = 1;

    std::atomic<bool> go{false};
    std::vector<std::string> failures(kThreads);
    std::vector<DWXCurrentFinder*> singletons(kThreads);
    std::vector<std::thread> threads;
    for (int id = 0; id < kThreads; ++id) {
        threads.emplace_back([&, id] {
            while (!go.load()) {
                std::this_thread::yield();
            }
            Check check;
            for (int round = 0; round < rounds; ++round) {
                Colours(check, id);  // first, so that the first uses meet
                Registries(check, id, &singletons[id]);
                Containers(check, id);
                ParseTree(check, id, files[id]);
                StringsAndCommandLine(check, id);
                DatesAndMapping(check, id);
            }
            failures[id] = check.Text();
        });
    }
    go = true;
    for (std::thread& thread : threads) {
        thread.join();
    }
    tzn::tracer::Debugger::moDebugLevel = 0;
    tzn::tracer::Debugger::SetStream(previousTrace == stderr ? nullptr : previousTrace);
    fclose(trace);
    IMPSetErrorHandler(previous);

    for (int id = 0; id < kThreads; ++id) {
        EXPECT_EQ(failures[id], "") << "thread " << id;
        EXPECT_EQ(singletons[id], singletons[0]) << "thread " << id;
    }
    EXPECT_EQ(gReports.load(), kThreads * rounds * reportsPerDate);  // every report arrives
}

}  // namespace

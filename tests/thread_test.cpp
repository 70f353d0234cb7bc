// Separate objects on separate threads: every family at once from several
// threads, each thread with objects of its own, and the first use of the
// lazily made process-wide tables (named colours, the current-object
// registry, the exit list) made by those threads together. The tsan preset
// runs this under ThreadSanitizer; the answers are checked on every build.
#include "report_capture.h"
#include "scratch_dir.h"
#include "tree_test_util.h"

#include <dwxcore/dwxcmdline.h>
#include <dwxcore/dwxcolor.h>
#include <dwxcore/dwxcolorpref.h>
#include <dwxcore/dwxcurrentfinder.h>
#include <dwxcore/dwxdate.h>
#include <dwxcore/dwxprefmodel.h>
#include <dwxcore/dwxstring.h>
#include <dwxcore/dwxtranslate.h>
#include <services/tracer.h>

#include <gtest/gtest.h>

#include <stdlib.h>

#include <atomic>
#include <memory>
#include <string>
#include <thread>
#include <vector>

namespace {

constexpr int kThreads = 4;

// One round of every family on thread `id`; the names of the checks that failed.
std::string Round(int id, const std::string& file) {
    std::string failed;
    auto expect = [&failed](bool ok, const char* what) {
        failed += ok || failed.size() > 1000 ? "" : std::string(what) + " ";
    };
    const std::string n = std::to_string(id);

    DWXColor colour;  // first, so that the first uses of the colour table meet
    expect(colour.SetByName("orange") && colour.GetGreen() == 128 &&
               std::string(DWXColor(id, 2, 3).GetName()) == "(RGB:" + n + " 2 3)",
           "colour");
    PTNSubTree window("window");
    PTNPreferenceModel model(&window);
    DWXColorPreferenceFormat format(&model);
    DWXColor* stored = &colour;
    format.SetPreference("Fill", reinterpret_cast<char*>(&stored));
    std::unique_ptr<DWXColor> back(format.GetPreference(nullptr, "Fill"));
    expect(back && *back == colour, "colour preference");

    CurrentFinder<DWXObject> own;
    own.SetCurrent("doc", new PTNInteger("doc", id));
    auto* doc = static_cast<PTNInteger*>(own.GetCurrent("DOC"));
    expect(doc && doc->GetValue() == id && !GetDWXCurrentFinder()->GetCurrent("nobody"),
           "registry");

    std::unique_ptr<DWXContainer> containers[] = {
        std::make_unique<DWXArray>(), std::make_unique<DWXPackedArray>(),
        std::make_unique<DWXBag>(), std::make_unique<DWXLinkedList>()};
    for (const auto& container : containers) {
        int sum = 0;
        for (int i = 1; i <= 10; ++i) {
            container->Add(new PTNInteger("i", i));
        }
        DWXIter it(container.get());
        for (DWXObject* object = it.Start(); object; object = it.Next()) {
            sum += static_cast<PTNInteger*>(object)->GetValue();
        }
        expect(sum == 55, container->GetClassName());
        container->DestroyContents();
    }

    PTNSubTree tree("root");
    ReadFile(tree, file);  // includes a file that every thread reads
    expect(Shape(&tree, true) == "own{id:PTNInteger=" + n + " common{shared:PTNInteger=1}}",
           "read");
    FILE* stream = tmpfile();
    tree.WriteToFile(stream);
    expect(PTNSubTree::PTNValidateFile(stream, "root") == 1, "validate");
    fclose(stream);
    const unsigned char bytes[] = {static_cast<unsigned char>(id), 0, 255};
    expect(base64_decode(base64_encode(bytes, 3)) == std::string(bytes, bytes + 3), "base64");

    DWXString text = DWXFormat("thread %d", id) + DWXString("!");
    expect(std::string(static_cast<const char*>(text)) == "thread " + n + "!", "string");
    expect(DWXCmdLine(("prog -id " + n).c_str()).GetInt("-ID", -1, 0) == id, "command line");
    expect(std::string(DWXDate(7, 4, 2000 + id).GetString()) == "July 4, 200" + n, "date");
    DWXDate invalid(13, 1, 2000);  // reported
    DWXTranslate map;
    map.SetSrcRect(0, 0, 10, 10);
    map.SetDestRect(0, 0, 100 * id, 100);
    expect(map.Src2DestX(5) == 50.0 * id, "mapping");
    return failed;
}

TEST(ThreadTest, SeparateObjectsOnSeparateThreads) {
    // Valgrind runs threads one at a time and slowly; a few rounds still walk
    // every path there.
    const int rounds = getenv("DWXCORE_UNDER_VALGRIND") ? 3 : 40;
    ScratchDir dir;
    std::string common = dir.Write("common.cfg", "(common SubTree\n  (shared Integer 1)\n)\n");
    ReportCapture capture;
    DWXDate(13, 1, 2000);  // the reports of one invalid date
    const size_t reportsPerDate = capture.Take().size();
    // Includes are traced, to a stream that every thread writes to.
    FILE* trace = tmpfile();
    FILE* previousTrace = tzn::tracer::Debugger::SetStream(trace);
    tzn::tracer::Debugger::moDebugLevel = 1;

    std::atomic<bool> go{false};
    std::vector<std::string> failures(kThreads);
    std::vector<DWXCurrentFinder*> singletons(kThreads);
    std::vector<std::thread> threads;
    for (int id = 0; id < kThreads; ++id) {
        std::string file = dir.Write("t" + std::to_string(id) + ".cfg",
                                     "(own SubTree\n  (id Integer " + std::to_string(id) +
                                         ")\n  (@include " + common + ")\n)\n");
        threads.emplace_back([&, id, file] {
            while (!go.load()) {
                std::this_thread::yield();
            }
            // Half the threads begin with the colour table, half with the
            // current-object registry, so that first uses of each meet.
            if (id % 2 == 0) {
                DWXColor().SetByName("red");
            }
            singletons[id] = GetDWXCurrentFinder();
            for (int round = 0; round < rounds && failures[id].empty(); ++round) {
                failures[id] = Round(id, file);
            }
        });
    }
    go = true;
    for (std::thread& thread : threads) {
        thread.join();
    }
    tzn::tracer::Debugger::moDebugLevel = 0;
    tzn::tracer::Debugger::SetStream(previousTrace == stderr ? nullptr : previousTrace);
    fclose(trace);
    for (int id = 0; id < kThreads; ++id) {
        EXPECT_EQ(failures[id] + (singletons[id] == singletons[0] ? "" : "singleton"), "") << id;
    }
    EXPECT_EQ(capture.Reports().size(),
              kThreads * rounds * reportsPerDate);  // every report arrives
}

}  // namespace

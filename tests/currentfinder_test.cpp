// The registry of current objects: what it owns and deletes when, in which
// order the exit deletes, and a fresh registry after that.
#include <dwxcore/dwxcurrentfinder.h>

#include <gtest/gtest.h>

#include <stdio.h>

#include <string>

namespace {

// Runs the exit routine the way process exit does.
struct ExitProcessing : DWXCurrentFinder {
    static void Run() { ExitCB(); }
};

std::string gDeleted;
bool gToStderr = false;  // set in an exiting child: deletions are written there

// Notes its name when deleted.
class Noted : public DWXObject {
  public:
    explicit Noted(const char* name) : oName(std::string(name) + " ") {}
    ~Noted() override {
        if (gToStderr) {
            fputs(oName.c_str(), stderr);
        } else {
            gDeleted += oName;
        }
    }
    const char* GetClassName() const override { return "Noted"; }

  private:
    std::string oName;
};

}  // namespace

// Replaced objects are deleted at once, released ones belong to the caller,
// and one object under two names is deleted once.
TEST(Registry, OwnsWhatItHoldsAndDeletesItOnce) {
    ExitProcessing::Run();  // a registry of this test's own
    DWXCurrentFinder* registry = GetDWXCurrentFinder();
    Noted* first = new Noted("first");
    registry->SetCurrent("View", first);
    registry->SetCurrent("view", first);
    EXPECT_TRUE(registry->GetCurrent("VIEW") == first && !registry->GetCurrent("Views"));
    registry->SetCurrent("view", new Noted("second"));
    registry->SetCurrent("view", nullptr);
    EXPECT_EQ(gDeleted, "first second ");

    Noted* kept = new Noted("kept");  // a null name is the empty name
    registry->SetCurrent(nullptr, kept);
    EXPECT_TRUE(registry->GetCurrent("") == kept && registry->ReleaseCurrent("") == kept &&
                !registry->ReleaseCurrent(""));
    Noted* shared = new Noted("shared");
    registry->SetCurrent("b", shared);
    registry->SetCurrent("c", shared);
    registry->SetCurrent("b", new Noted("b"));
    registry->SetCurrent("f", shared);  // still under two names at the exit
    registry->SetCurrent("d", kept);
    registry->SetCurrent("e", kept);
    // Released, it leaves the table under every name.
    EXPECT_TRUE(registry->ReleaseCurrent("d") == kept && !registry->GetCurrent("e"));
    registry->SetCurrent("Alpha", new Noted("Alpha"));
    registry->SetCurrent("empty", nullptr);
    ExitProcessing::Run();  // in name order, ignoring case
    ExitProcessing::Run();
    EXPECT_EQ(gDeleted, "first second Alpha b shared ");
    EXPECT_EQ(nullptr, GetDWXCurrentFinder()->GetCurrent("alpha"));
    delete kept;
}

// At a real process exit every recorded object goes, also in a registry made
// after an earlier exit run.
TEST(RegistryAtExitDeathTest, ObjectsAreDeletedWhenTheProcessExits) {
    EXPECT_EXIT(
        {
            gToStderr = true;
            GetDWXCurrentFinder()->SetCurrent("gone", new Noted("gone"));
            ExitProcessing::Run();
            GetDWXCurrentFinder()->SetCurrent("two", new Noted("two"));
            GetDWXCurrentFinder()->SetCurrent("one", new Noted("one"));
            exit(0);
        },
        ::testing::ExitedWithCode(0), "^gone one two $");
}

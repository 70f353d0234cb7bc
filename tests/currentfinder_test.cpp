#include <dwxcore/dwxcurrentfinder.h>
#include <services/utilhub.h>

#include "counting_object.h"

#include <gtest/gtest.h>

#include <dlfcn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <string>
#include <vector>

DEFINE_COUNTING_OBJECT_COUNTERS();

namespace {

// Reaches the exit routine the way process exit does.
struct ExitProcessing : DWXCurrentFinder {
    static void Run() { ExitCB(); }
};

// Records the order of deletions by name.
std::vector<std::string> gDeleted;

class NamedObject : public CountingObject {
  public:
    explicit NamedObject(const char* name) : oName(name) {}
    ~NamedObject() override { gDeleted.push_back(oName); }

  private:
    std::string oName;
};

// Writes one byte to a pipe when deleted, so a parent sees deletions made
// while its child process exits.
class PipeObject : public DWXObject {
  public:
    explicit PipeObject(int fd) : nFd(fd) {}
    ~PipeObject() override {
        ssize_t written = write(nFd, "d", 1);
        (void)written;
    }
    const char* GetClassName() const override { return "PipeObject"; }

  private:
    int nFd;
};

// Every registration with the exit service, seen on its way through.
struct Registration {
    void (*callback)();
    std::string source;
    int line;
};
std::vector<Registration> gRegistrations;

// Kept reachable so a child that exits with it is not reported as leaking.
DWXObject* gReleased = nullptr;

// Starts from an empty registry and empty counters.
class Registry : public ::testing::Test {
  protected:
    void SetUp() override {
        ExitProcessing::Run();
        CountingObject::Reset();
        gDeleted.clear();
    }
    void TearDown() override { ExitProcessing::Run(); }
};

// Runs `child` in a forked process that then exits normally; returns how many
// PipeObjects were deleted in it, or -1 when it did not exit with status 0.
int DeletionsInExitingChild(void (*child)(int fd)) {
    int fds[2];
    if (pipe(fds) != 0) {
        return -1;
    }
    pid_t pid = fork();
    if (pid == 0) {
        close(fds[0]);
        child(fds[1]);
        exit(0);
    }
    close(fds[1]);
    int count = 0;
    char byte;
    while (read(fds[0], &byte, 1) == 1) {
        ++count;
    }
    close(fds[0]);
    int status = 0;
    waitpid(pid, &status, 0);
    return (WIFEXITED(status) && WEXITSTATUS(status) == 0) ? count : -1;
}

}  // namespace

// Passes every exit registration on to the service after noting it; the
// dynamic linker binds the library's call to this definition.
void _IMPAtExit(void (*callback)(), const char* sourceFile, int line) {
    gRegistrations.push_back({callback, sourceFile ? sourceFile : "(null)", line});
    using AtExit = void (*)(void (*)(), const char*, int);
    // The service's own definition, under its Itanium C++ ABI name.
    static AtExit next = reinterpret_cast<AtExit>(dlsym(RTLD_NEXT, "_Z10_IMPAtExitPFvvEPKci"));
    ASSERT_NE(nullptr, next);
    next(callback, sourceFile, line);
}

TEST_F(Registry, OneInstanceRegisteringItsExitHook) {
    gRegistrations.clear();
    DWXCurrentFinder* registry = GetDWXCurrentFinder();
    ASSERT_NE(nullptr, registry);
    EXPECT_EQ(registry, GetDWXCurrentFinder());
    EXPECT_EQ(registry, DWXCurrentFinder::GetInstance());
    ASSERT_EQ(1u, gRegistrations.size());
    EXPECT_EQ("base/dwxcore/dwxcurrentfinder", gRegistrations[0].source);
    EXPECT_EQ(10, gRegistrations[0].line);

    // Running the registered routine is exit processing.
    registry->SetCurrent("doc", new CountingObject);
    gRegistrations[0].callback();
    EXPECT_EQ(1, CountingObject::destroyed);
    EXPECT_EQ(nullptr, GetDWXCurrentFinder()->GetCurrent("doc"));
    EXPECT_EQ(2u, gRegistrations.size());
}

TEST_F(Registry, NamesIgnoreCase) {
    DWXCurrentFinder* registry = GetDWXCurrentFinder();
    CountingObject* doc = new CountingObject(1);
    registry->SetCurrent("Document", doc);
    EXPECT_EQ(doc, registry->GetCurrent("document"));
    EXPECT_EQ(doc, registry->GetCurrent("DOCUMENT"));
    EXPECT_EQ(nullptr, registry->GetCurrent("Documents"));
    EXPECT_EQ(nullptr, registry->GetCurrent("Doc"));
    EXPECT_EQ(nullptr, registry->GetCurrent(nullptr));

    // A null name is the empty name.
    CountingObject* unnamed = new CountingObject(2);
    registry->SetCurrent(nullptr, unnamed);
    EXPECT_EQ(unnamed, registry->GetCurrent(""));
    EXPECT_EQ(unnamed, registry->ReleaseCurrent(nullptr));
    delete unnamed;
}

TEST_F(Registry, ReplacingDeletesTheOldObjectOnce) {
    DWXCurrentFinder* registry = GetDWXCurrentFinder();
    CountingObject* first = new CountingObject(1);
    CountingObject* second = new CountingObject(2);
    registry->SetCurrent("view", first);
    registry->SetCurrent("view", first);
    EXPECT_EQ(0, CountingObject::destroyed);
    registry->SetCurrent("VIEW", second);
    EXPECT_EQ(1, CountingObject::destroyed);
    EXPECT_EQ(second, registry->GetCurrent("view"));
    registry->SetCurrent("view", nullptr);
    EXPECT_EQ(2, CountingObject::destroyed);
    EXPECT_EQ(nullptr, registry->GetCurrent("view"));
}

TEST_F(Registry, ReleasedObjectsBelongToTheCaller) {
    DWXCurrentFinder* registry = GetDWXCurrentFinder();
    CountingObject* kept = new CountingObject(1);
    registry->SetCurrent("kept", kept);
    EXPECT_EQ(nullptr, registry->ReleaseCurrent("absent"));
    EXPECT_EQ(kept, registry->ReleaseCurrent("KEPT"));
    EXPECT_EQ(nullptr, registry->GetCurrent("kept"));
    EXPECT_EQ(nullptr, registry->ReleaseCurrent("kept"));
    ExitProcessing::Run();
    EXPECT_EQ(0, CountingObject::destroyed);
    delete kept;
}

// One object under two names is still deleted exactly once, and a caller who
// releases it under one name owns it outright.
TEST_F(Registry, SharedObjectIsOwnedOnce) {
    DWXCurrentFinder* registry = GetDWXCurrentFinder();
    CountingObject* shared = new CountingObject(1);
    registry->SetCurrent("a", shared);
    registry->SetCurrent("b", shared);
    registry->SetCurrent("a", new CountingObject(2));
    EXPECT_EQ(0, CountingObject::destroyed);
    EXPECT_EQ(shared, registry->GetCurrent("b"));
    ExitProcessing::Run();
    EXPECT_EQ(2, CountingObject::destroyed);

    registry = GetDWXCurrentFinder();
    shared = new CountingObject(3);
    registry->SetCurrent("a", shared);
    registry->SetCurrent("b", shared);
    EXPECT_EQ(shared, registry->ReleaseCurrent("a"));
    EXPECT_EQ(nullptr, registry->GetCurrent("b"));
    ExitProcessing::Run();
    EXPECT_EQ(2, CountingObject::destroyed);
    delete shared;
}

TEST_F(Registry, ExitDeletesEachObjectInNameOrderAndStartsAfresh) {
    DWXCurrentFinder* registry = GetDWXCurrentFinder();
    registry->SetCurrent("gamma", new NamedObject("gamma"));
    registry->SetCurrent("Alpha", new NamedObject("Alpha"));
    registry->SetCurrent("empty", nullptr);
    registry->SetCurrent("beta", new NamedObject("beta"));
    ExitProcessing::Run();
    EXPECT_EQ((std::vector<std::string>{"Alpha", "beta", "gamma"}), gDeleted);
    EXPECT_EQ(0, CountingObject::Alive());
    ExitProcessing::Run();
    EXPECT_EQ(3, CountingObject::destroyed);

    registry = GetDWXCurrentFinder();
    EXPECT_EQ(nullptr, registry->GetCurrent("alpha"));
    EXPECT_EQ(nullptr, registry->GetCurrent("empty"));
    EXPECT_EQ(registry, GetDWXCurrentFinder());
}

// At a real process exit every recorded object goes exactly once, also when a
// fresh registry has been made after an earlier exit run.
TEST(RegistryAtExit, ObjectsAreDeletedWhenTheProcessExits) {
    EXPECT_EQ(2, DeletionsInExitingChild([](int fd) {
                  GetDWXCurrentFinder()->SetCurrent("one", new PipeObject(fd));
                  GetDWXCurrentFinder()->SetCurrent("two", new PipeObject(fd));
                  GetDWXCurrentFinder()->SetCurrent("none", nullptr);
              }));
    EXPECT_EQ(2, DeletionsInExitingChild([](int fd) {
                  GetDWXCurrentFinder()->SetCurrent("gone", new PipeObject(fd));
                  ExitProcessing::Run();
                  GetDWXCurrentFinder()->SetCurrent("late", new PipeObject(fd));
              }));
    EXPECT_EQ(0, DeletionsInExitingChild([](int fd) {
                  GetDWXCurrentFinder()->SetCurrent("released", new PipeObject(fd));
                  gReleased = GetDWXCurrentFinder()->ReleaseCurrent("released");
              }));
}

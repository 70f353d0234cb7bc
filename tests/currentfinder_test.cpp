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

// Runs the exit routine the way process exit does.
struct ExitProcessing : DWXCurrentFinder {
    static void Run() { ExitCB(); }
};

std::vector<std::string> gDeleted;

// Notes its name when deleted, so tests see the order of deletions.
class NamedObject : public CountingObject {
  public:
    explicit NamedObject(const char* name) : oName(name) {}
    ~NamedObject() override { gDeleted.push_back(oName); }

  private:
    std::string oName;
};

// Writes one byte to a pipe when deleted, for deletions in an exiting child.
class PipeObject : public DWXObject {
  public:
    explicit PipeObject(int fd) : nFd(fd) {}
    ~PipeObject() override { (void)!write(nFd, "d", 1); }
    const char* GetClassName() const override { return "PipeObject"; }

  private:
    int nFd;
};

struct Registration {
    void (*callback)();
    std::string source;
    int line;
};
std::vector<Registration> gRegistrations;
DWXObject* gReleased = nullptr;  // reachable, so an exiting child does not leak it

class Registry : public ::testing::Test {
  protected:
    void SetUp() override {
        ExitProcessing::Run();
        CountingObject::Reset();
        gDeleted.clear();
    }
    void TearDown() override { ExitProcessing::Run(); }
};

// Runs `child` in a forked process that then exits normally; the number of
// PipeObjects deleted there, or -1 when it did not exit cleanly.
int DeletionsInExitingChild(void (*child)(int fd)) {
    int fds[2], count = 0, status = 0;
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
    for (char byte; read(fds[0], &byte, 1) == 1;) {
        ++count;
    }
    close(fds[0]);
    waitpid(pid, &status, 0);
    return (WIFEXITED(status) && WEXITSTATUS(status) == 0) ? count : -1;
}

}  // namespace

// Notes each exit registration and passes it on to the service (found under
// its C++ ABI name); the dynamic linker binds the library's call here.
void _IMPAtExit(void (*callback)(), const char* sourceFile, int line) {
    gRegistrations.push_back({callback, sourceFile ? sourceFile : "(null)", line});
    using AtExit = void (*)(void (*)(), const char*, int);
    static AtExit next = reinterpret_cast<AtExit>(dlsym(RTLD_NEXT, "_Z10_IMPAtExitPFvvEPKci"));
    ASSERT_NE(nullptr, next);
    next(callback, sourceFile, line);
}

TEST_F(Registry, OneInstanceWithItsExitHook) {
    gRegistrations.clear();
    DWXCurrentFinder* registry = GetDWXCurrentFinder();
    ASSERT_NE(nullptr, registry);
    EXPECT_EQ(registry, DWXCurrentFinder::GetInstance());
    EXPECT_EQ(registry, GetDWXCurrentFinder());
    ASSERT_EQ(1u, gRegistrations.size());
    EXPECT_EQ("base/dwxcore/dwxcurrentfinder", gRegistrations[0].source);
    EXPECT_EQ(10, gRegistrations[0].line);
    registry->SetCurrent("doc", new CountingObject);
    gRegistrations[0].callback();
    EXPECT_EQ(1, CountingObject::destroyed);
}

// Replaced objects are deleted at once, released ones belong to the caller,
// and one object under two names is deleted once.
TEST_F(Registry, SetGetReleaseOwnership) {
    DWXCurrentFinder* registry = GetDWXCurrentFinder();
    CountingObject* first = new CountingObject(1);
    registry->SetCurrent("View", first);
    registry->SetCurrent("view", first);
    EXPECT_EQ(first, registry->GetCurrent("VIEW"));
    EXPECT_EQ(nullptr, registry->GetCurrent("Views"));
    EXPECT_EQ(0, CountingObject::destroyed);
    registry->SetCurrent("view", new CountingObject(2));
    EXPECT_EQ(1, CountingObject::destroyed);
    registry->SetCurrent("view", nullptr);
    EXPECT_EQ(2, CountingObject::destroyed);

    CountingObject* kept = new CountingObject(3);  // a null name is the empty name
    registry->SetCurrent(nullptr, kept);
    EXPECT_EQ(kept, registry->GetCurrent(""));
    EXPECT_EQ(kept, registry->ReleaseCurrent(""));
    EXPECT_EQ(nullptr, registry->ReleaseCurrent(""));
    CountingObject* shared = new CountingObject(4);
    registry->SetCurrent("a", shared);
    registry->SetCurrent("b", shared);
    registry->SetCurrent("a", new CountingObject(5));
    registry->SetCurrent("c", kept);
    registry->SetCurrent("d", kept);
    EXPECT_EQ(kept, registry->ReleaseCurrent("c"));  // leaves the table under every name
    EXPECT_EQ(nullptr, registry->GetCurrent("d"));
    EXPECT_EQ(2, CountingObject::destroyed);
    ExitProcessing::Run();
    EXPECT_EQ(4, CountingObject::destroyed);
    delete kept;
}

TEST_F(Registry, ExitDeletesInNameOrderAndStartsAfresh) {
    DWXCurrentFinder* registry = GetDWXCurrentFinder();
    for (const char* name : {"gamma", "Alpha", "beta"}) {
        registry->SetCurrent(name, new NamedObject(name));
    }
    registry->SetCurrent("empty", nullptr);
    ExitProcessing::Run();
    ExitProcessing::Run();
    EXPECT_EQ((std::vector<std::string>{"Alpha", "beta", "gamma"}), gDeleted);
    EXPECT_EQ(0, CountingObject::Alive());
    EXPECT_EQ(nullptr, GetDWXCurrentFinder()->GetCurrent("alpha"));
    EXPECT_EQ(nullptr, GetDWXCurrentFinder()->GetCurrent("empty"));
}

// At a real process exit every recorded object goes exactly once, also with a
// fresh registry made after an earlier exit run.
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

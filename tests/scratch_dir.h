// A fresh directory for one test, removed with everything in it when the
// test ends. Tests that read and search files write them here.
#pragma once

#include <gtest/gtest.h>

#include <stdlib.h>

#include <filesystem>
#include <fstream>
#include <string>

class ScratchDir {
  public:
    ScratchDir() : oRoot((std::filesystem::temp_directory_path() / "dwxcore_XXXXXX").string()) {
        EXPECT_NE(mkdtemp(&oRoot[0]), nullptr);
    }
    ~ScratchDir() { std::filesystem::remove_all(oRoot); }
    ScratchDir(const ScratchDir&) = delete;

    const std::string& Root() const { return oRoot; }
    std::string Path(const std::string& name) const { return oRoot + "/" + name; }
    // Writes `text` to file `name` (directories on its path made first); returns its path.
    std::string Write(const std::string& name, const std::string& text) const {
        std::filesystem::create_directories(std::filesystem::path(Path(name)).parent_path());
        std::ofstream(Path(name), std::ios::binary) << text;
        return Path(name);
    }
    // Empties the directory and keeps it.
    void Clear() const {
        std::filesystem::remove_all(oRoot);
        std::filesystem::create_directories(oRoot);
    }

  private:
    std::string oRoot;
};

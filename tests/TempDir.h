// A folder of the test's own, and the environment that all tests expect.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <string>

#include "EPFileBuilder.h"

/// Times in UTC, messages in English, no LUN list, whatever the caller has set.
inline const bool environmentSet =
    setenv("TZ", "UTC", 1) == 0 && setenv("LC_ALL", "C", 1) == 0 && unsetenv("KELPISCSIEP_LUNS") == 0;

/// Gone at its end.
class TempDir {
public:
    TempDir() { EXPECT_NE(nullptr, mkdtemp(path_.data())); }
    TempDir(const TempDir&) = delete;
    TempDir& operator=(const TempDir&) = delete;
    ~TempDir() { std::filesystem::remove_all(path_); }

    std::string path(const std::string& name) const { return path_ + "/" + name; }

    /// Writes the file `name` and returns its path.
    std::string write(const std::string& name, const epbuilder::EPFileBuilder& builder) const {
        builder.write(path(name));
        return path(name);
    }

private:
    std::string path_ = (std::filesystem::temp_directory_path() / "eptestXXXXXX").string();
};

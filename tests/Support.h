// What the tests share: log lines as they reach syslog(), and a folder for files.
#pragma once

#include <gtest/gtest.h>

#include <fstream>
#include <string>
#include <vector>

#include "EPFileBuilder.h"

/// The lines that have reached syslog() since the last call; one that was not at LOG_ERR says so.
std::vector<std::string> takeLog();

/// "iSCSI:SOURCE path: PATH" for each source, as a failure chain about one path leaves them.
std::vector<std::string> chain(const std::string& path, const std::vector<std::string>& sources);

/// A folder of the test's own, gone at its end.
class TempDir {
public:
    TempDir();
    TempDir(const TempDir&) = delete;
    TempDir& operator=(const TempDir&) = delete;
    ~TempDir();

    std::string path(const std::string& name) const { return path_ + "/" + name; }

    /// Writes the file `name` and returns its path.
    std::string write(const std::string& name, const epsample::EPFileBuilder& builder) const {
        builder.write(path(name));
        return path(name);
    }
    std::string write(const std::string& name, const std::string& text) const {
        std::ofstream(path(name)) << text;
        return path(name);
    }

private:
    std::string path_;
};

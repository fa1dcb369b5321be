// What the tests of epinspect and epsample share: commands as they are typed, and what they print, say and end with.
// Included once per test program.
#pragma once

#include <gtest/gtest.h>
#include <pty.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <fstream>
#include <sstream>
#include <string>

#include "TempDir.h"

using epbuilder::EPFileBuilder;

struct Result {
    int status;  ///< as a shell tells it: 128 and more after a signal
    std::string out, err;
};

/// A command, and what it shall end with, print to standard output and to standard error; "..." there stands for
/// anything.
struct Case {
    const char* promise;  ///< the name of the test, with blanks
    std::string command;
    int status;
    std::string out, err;
};

inline void PrintTo(const Case& c, std::ostream* stream) { *stream << c.command; }

inline std::string nameOf(const testing::TestParamInfo<Case>& info) {
    std::string name = info.param.promise;
    std::replace(name.begin(), name.end(), ' ', '_');
    return name;
}

inline bool matches(const std::string& text, const std::string& pattern) {
    const auto dots = pattern.find("...");
    if (dots == std::string::npos) return text == pattern;
    if (text.compare(0, dots, pattern, 0, dots) != 0) return false;
    const std::string rest = pattern.substr(dots + 3);
    const auto next = rest.substr(0, rest.find("..."));
    if (next == rest) return text.size() >= dots + rest.size() && text.substr(text.size() - rest.size()) == rest;
    const auto found = text.find(next, dots);
    return found != std::string::npos && matches(text.substr(found), rest);
}

/// A test in a folder of its own, which is the current one of its commands. In it `store` leads to a sample store that
/// all tests share.
class ProgramTest : public testing::Test {
protected:
    ProgramTest() {
        static const TempDir shared;
        static const Result made = run("epsample '" + shared.path("store") + "'");
        EXPECT_EQ("", made.err);
        std::filesystem::create_symlink(shared.path("store"), path("store"));
    }

    std::string path(const std::string& name) const { return folder_.path(name); }
    void write(const std::string& name, const EPFileBuilder& builder) const { folder_.write(name, builder); }

    std::string contentOf(const std::string& name) const {
        std::ostringstream text;
        text << std::ifstream(path(name), std::ios::binary).rdbuf();
        return text.str();
    }

    /// What makes the shell do `command` in the test's folder, whatever the environment of the tests is.
    std::string script(const std::string& command) const {
        return "unset KELPISCSIEP_LUNS; export TZ=UTC LC_ALL=C PATH='" PROGRAMS "':\"$PATH\"; cd '" + path("") +
               "'; {\n" + command + "\n}";
    }

    Result run(const std::string& command) const {
        const int status = std::system((script(command) + " >.out 2>.err").c_str());
        return {WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status), contentOf(".out"),
                contentOf(".err")};
    }

    void expect(const Case& c) const {
        const Result result = run(c.command);
        EXPECT_EQ(c.status, result.status);
        EXPECT_TRUE(matches(result.out, c.out)) << result.out.substr(0, 4000) << "is not\n" << c.out;
        EXPECT_TRUE(matches(result.err, c.err)) << result.err.substr(0, 4000) << "is not\n" << c.err;
    }

private:
    TempDir folder_;
};

/// The same for each row of a table: TEST_P(X, ...) { expect(GetParam()); }
class ProgramCases : public ProgramTest, public testing::WithParamInterface<Case> {};

/// A terminal on which the shell does something.
class Terminal {
public:
    Terminal(const std::string& script, unsigned short columns) {
        const winsize size = {24, columns, 0, 0};
        shell_ = forkpty(&terminal_, nullptr, nullptr, &size);
        if (shell_ != 0) return;
        execl("/bin/sh", "sh", "-c", script.c_str(), nullptr);
        _exit(127);
    }
    Terminal(const Terminal&) = delete;
    Terminal& operator=(const Terminal&) = delete;
    ~Terminal() { close(terminal_); }

    void type(const std::string& keys) const {
        EXPECT_EQ(ssize_t(keys.size()), write(terminal_, keys.data(), keys.size()));
    }

    /// Waits until `text` is shown; returns all that was until then, without the terminal's carriage returns at the
    /// ends of lines.
    std::string shownUntil(const std::string& text) {
        char byte = 0;
        while (shown_.find(text) == std::string::npos && read(terminal_, &byte, 1) == 1) {
            if (byte == '\n' && !shown_.empty() && shown_.back() == '\r') shown_.pop_back();
            shown_ += byte;
        }
        return shown_;
    }

    /// Waits for the end; returns the shell's status and all that was shown.
    Result finish() {
        shownUntil(std::string(1, '\0'));
        int status = 0;
        EXPECT_EQ(shell_, waitpid(shell_, &status, 0));
        return {WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status), shown_, ""};
    }

private:
    int terminal_ = -1;
    pid_t shell_ = -1;
    std::string shown_;
};

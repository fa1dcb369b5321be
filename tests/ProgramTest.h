// What the tests of epinspect and epsample share: commands as they are typed, and what they print, say and end with.
#pragma once

#include <fcntl.h>
#include <gtest/gtest.h>
#include <pty.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cctype>
#include <csignal>
#include <fstream>
#include <functional>
#include <string>
#include <utility>

#include "Fits.h"
#include "TempDir.h"

using epbuilder::EPFileBuilder;

/// A promise, which becomes the name of its test: a command, its exit status (128 and more after a signal), and what it
/// prints to standard output and error; "…" in these texts stands for anything.
struct Case {
    std::string promise, command;
    int status;
    std::string out, err;
};

inline void PrintTo(const Case& c, std::ostream* stream) { *stream << c.command; }

inline std::string nameOf(const testing::TestParamInfo<Case>& info) {
    std::string name = info.param.promise;
    for (char& c : name) c = std::isalnum(static_cast<unsigned char>(c)) != 0 ? c : '_';
    return name;
}

/// What epinspect writes to standard error for these messages.
inline std::string says(std::initializer_list<std::string> messages) {
    std::string lines;
    for (const std::string& message : messages) lines += "epinspect: " + message + "\n";
    return lines;
}

const std::string missing = ": cannot be opened: No such file or directory (EP_ERR_OPEN_FAILED, 18990038)";
const std::string wrongType = ": wrong type of EP file (EP_ERR_WRONG_FILE_TYPE, 18990400)";
inline std::string holds(const std::string& what) {
    return ": past the end, the file holds " + what + " (EP_ERR_READ_FAILED, 18990039)";
}

inline int exitStatus(int status) { return WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status); }

/// Keeps this process and what it starts from running wild: for longer than a minute, or filling the disk with a file.
/// It can be interrupted even where the tests run in the background.
inline void limitProcess() {
    signal(SIGINT, SIG_DFL);
    const rlimit fileSize = {8U << 20U, RLIM_INFINITY};
    setrlimit(RLIMIT_FSIZE, &fileSize);
    alarm(60);
}

/// Tests in a folder of their own, which is the current one of their commands. In it `store` is a link to a sample
/// store that all tests share.
class ProgramTest : public testing::TestWithParam<Case> {
protected:
    ProgramTest() {
        static const TempDir shared;
        static const int made = run("epsample '" + shared.path("store") + "'");
        EXPECT_EQ(0, made);
        std::filesystem::create_symlink(shared.path("store"), path("store"));
    }

    std::string path(const std::string& name) const { return folder_.path(name); }
    void write(const std::string& name, const EPFileBuilder& builder) const { folder_.write(name, builder); }

    /// What makes the shell do `command` in the test's folder. There `large` lifts the limit of a file's size, as
    /// epsample needs it for its sparse files, and `closed` takes the rights of a superuser away.
    std::string script(const std::string& command) const {
        return "unset COLUMNS; PATH='" PROGRAMS
               "':\"$PATH\"; large() { (ulimit -S -f unlimited; \"$@\"); }; "
               "epsample() { large command epsample \"$@\"; }; "
               "closed() { if [ $(id -u) = 0 ]; then setpriv --bounding-set=-all --inh-caps=-all \"$@\"; "
               "else \"$@\"; fi; }; cd '" +
               path("") + "'; {\n" + command + "\n}";
    }

    std::string content(const std::string& name) const {
        std::ifstream file(path(name), std::ios::binary);
        return {std::istreambuf_iterator<char>(file), {}};
    }

    /// Lets a process do `action`, its output in the files .out and .err; returns its exit status.
    int run(const std::function<void()>& action) const {
        const pid_t child = fork();
        if (child == 0) {
            limitProcess();
            dup2(open(path(".out").c_str(), O_CREAT | O_TRUNC | O_WRONLY, 0600), STDOUT_FILENO);
            dup2(open(path(".err").c_str(), O_CREAT | O_TRUNC | O_WRONLY, 0600), STDERR_FILENO);
            action();
            _exit(0);
        }
        int status = 0;
        EXPECT_EQ(child, waitpid(child, &status, 0));
        return exitStatus(status);
    }

    /// The same for a command; `timeout` ends it with all that it has started.
    int run(const std::string& command) const {
        return run(
            [text = script(command)] { execlp("timeout", "timeout", "-k1", "60", "sh", "-c", text.c_str(), nullptr); });
    }

    void expect(const Case& c) const {
        EXPECT_EQ(c.status, run(c.command));
        EXPECT_TRUE(fits(content(".out"), c.out));
        EXPECT_TRUE(fits(content(".err"), c.err));
    }

private:
    TempDir folder_;
};

/// A terminal, `columns` wide, on which a process does something. The carriage returns at the ends of lines are left
/// out.
class Terminal {
public:
    Terminal(unsigned short columns, const std::function<void()>& action) {
        const winsize size = {24, columns, 0, 0};
        process_ = forkpty(&terminal_, nullptr, nullptr, &size);
        if (process_ != 0) return;
        limitProcess();
        action();
        _exit(0);
    }
    Terminal(unsigned short columns, const std::string& script)
        : Terminal(columns, [&script] { execl("/bin/sh", "sh", "-c", script.c_str(), nullptr); }) {}
    ~Terminal() { close(terminal_); }

    void interrupt() const { EXPECT_EQ(1, write(terminal_, "\003", 1)); }
    void signal(int number) const { EXPECT_EQ(0, kill(-process_, number)); }

    /// All that is shown until it ends in `text`, but not much more than a screen holds.
    std::string shownUntil(const std::string& text) {
        char byte = 0;
        while (shown_.size() < 65536 && read(terminal_, &byte, 1) == 1) {
            if (byte == '\n' && !shown_.empty()) shown_.pop_back();
            shown_ += byte;
            if (shown_.size() >= text.size() && shown_.compare(shown_.size() - text.size(), text.size(), text) == 0)
                break;
        }
        return shown_;
    }

    /// All that is shown to the end, and "=STATUS". The process ends at the latest when the terminal is closed.
    std::string shown() {
        shownUntil(std::string(1, '\0'));
        close(std::exchange(terminal_, -1));
        int status = 0;
        EXPECT_EQ(process_, waitpid(process_, &status, 0));
        return shown_ + "=" + std::to_string(exitStatus(status));
    }

private:
    int terminal_ = -1;
    pid_t process_ = -1;
    std::string shown_;
};

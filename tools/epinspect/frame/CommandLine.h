// What may stand on the command line, its help, and its parsing from left to right: the first fault is the one that is
// named. (CLI11 2.1 is no help here: it takes a file named "[x]" for x, and finds faults in an order of its own.)
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "frame/UsageError.h"

namespace epinspect {

/// One subcommand, or the program itself: the arguments in their order, the options, and what is done.
class Command {
public:
    enum class Need { one, oneOrNone, several, severalOrNone };

    Command(std::string fullName, const char* about) : name_(std::move(fullName)), about_(about) {}

    /// An argument without a name of its own on the command line; shown as `name` in the help.
    template <typename Target, typename Parse>
    Command& argument(const char* name, const char* about, Target& target, Parse parse, Need need = Need::one) {
        arguments_.push_back({name, "", about, assignTo(target, parse), need});
        return *this;
    }

    Command& argument(const char* name, const char* about, std::string& target, Need need = Need::one) {
        return argument(name, about, target, asTyped, need);
    }

    /// Arguments as above, of which there may be several.
    template <typename Target, typename Parse>
    Command& arguments(const char* name, const char* about, std::vector<Target>& target, Parse parse,
                       Need need = Need::several) {
        const auto take = [&target, parse](const std::string& text) { target.push_back(parse(text)); };
        arguments_.push_back({name, "", about, take, need});
        return *this;
    }

    Command& arguments(const char* name, const char* about, std::vector<std::string>& target,
                       Need need = Need::several) {
        return arguments(name, about, target, asTyped, need);
    }

    /// An option with a value: "--first N". Short options take none: throws std::logic_error where `name` is not one
    /// long name.
    template <typename Target, typename Parse>
    Command& option(const char* name, const char* value, const char* about, Target& target, Parse parse,
                    Need need = Need::oneOrNone) {
        requireLongName(name);
        options_.push_back({name, value, about, assignTo(target, parse), need});
        return *this;
    }

    /// An option without a value, which does `take`.
    Command& flag(const char* name, const char* about, const std::function<void()>& take);

    /// An option without a value, which sets `target`.
    Command& flag(const char* name, const char* about, bool& target);

    /// Two options that may not stand together.
    Command& exclusive(const char* one, const char* other);

    /// What is done when this subcommand was typed; may throw UsageError.
    Command& action(std::function<void()> run);

    /// Makes a heading in the help for the subcommands that come after it.
    Command& group(const char* heading);

    /// A subcommand of this one, below the latest heading, which there must be.
    Command& add(const char* name, const char* about);

private:
    friend class CommandLine;
    using Take = std::function<void(const std::string&)>;

    struct Parameter {
        const char* name;   ///< "MAP", "--first", "-v, --verbose"
        const char* value;  ///< "N"; "" for an argument or a flag
        const char* about;
        Take take;
        Need need;
        unsigned int count = 0;  ///< how often it was given
    };

    struct Group {
        const char* heading;
        std::vector<std::unique_ptr<Command>> commands;
    };

    static std::string asTyped(const std::string& text);
    static void requireLongName(std::string_view name);

    template <typename Target, typename Parse>
    static Take assignTo(Target& target, Parse parse) {
        return [&target, parse](const std::string& text) { target = parse(text); };
    }

    std::string help(const std::vector<Parameter>& everywhere) const;
    std::string synopsis() const;
    Command* find(const std::string& name) const;
    std::string subcommandNames() const;

    /// What follows from all arguments together: what is missing, and what excludes what.
    void checkWhole() const;

    static void take(Parameter& parameter, const std::string& text);
    void takeArgument(const std::string& text);

    std::string name_;
    const char* about_;
    std::vector<Parameter> arguments_;
    std::vector<Parameter> options_;
    std::vector<std::pair<const char*, const char*>> exclusive_;
    std::vector<Group> groups_;
    std::function<void()> run_;
};

/// The whole command line.
class CommandLine {
public:
    CommandLine(const char* program, const char* about, const char* version);

    /// The program itself, to which subcommands are added.
    Command& program() { return program_; }

    /// Options that may stand anywhere.
    Command& everywhere() { return everywhere_; }

    /// What is done before a subcommand; with false the subcommand is not.
    void beforeAction(std::function<bool()> prepare) { prepare_ = std::move(prepare); }

    /// Parses the command line and does what it says. Returns false after wrong usage, which it complains about.
    bool run(int argc, char** argv);

private:
    void parse(char** arguments);
    void takeArgument(const std::string& text);
    void takeLongOption(const std::string& text);
    void takeShortOptions(const std::string& text);
    Command::Parameter& findOption(const std::string& name, const std::string& text);
    void showHelp() const;

    const char* versionText_;
    Command program_;
    Command everywhere_;
    Command* current_ = &program_;  ///< the subcommand that was typed
    bool help_ = false;
    bool version_ = false;
    std::vector<std::string> helpOn_;
    std::function<bool()> prepare_ = [] { return true; };
    char** next_ = nullptr;  ///< the argument that is parsed next; null ends them
};

}  // namespace epinspect

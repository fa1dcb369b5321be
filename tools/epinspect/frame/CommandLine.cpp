#include "frame/CommandLine.h"

#include <algorithm>
#include <cctype>
#include <stdexcept>
#include <string_view>
#include <utility>

#include "frame/Output.h"

namespace epinspect {

namespace {

/// Whether `name` is one of those in `names`, which are separated by ", ".
bool isOneOf(std::string_view names, std::string_view name) {
    while (!names.empty()) {
        const auto end = std::min(names.find(", "), names.size());
        if (names.substr(0, end) == name) return true;
        names.remove_prefix(std::min(names.size(), end + 2));
    }
    return false;
}

constexpr char noBreak = '\x1f';  ///< stands for a blank at which no line ends

/// A row of the help: what is typed, and what it means; the meaning gets lines of its own where the first is too long.
std::string helpRow(const std::string& typed, const std::string& meaning, unsigned int column) {
    const std::string text = "  " + typed;
    if (text.size() + 2 > column) {
        return text + "\n" + wrapped(std::string(column, ' ') + meaning, outputWidth(), column);
    }
    return wrapped(text + std::string(column - text.size(), ' ') + meaning, outputWidth(), column);
}

bool isOptional(Command::Need need) { return need == Command::Need::oneOrNone || need == Command::Need::severalOrNone; }

bool takesSeveral(Command::Need need) { return need == Command::Need::several || need == Command::Need::severalOrNone; }

}  // namespace

std::string Command::asTyped(const std::string& text) {
    if (text.empty()) throw UsageError{"must not be empty"};
    return text;
}

void Command::requireLongName(std::string_view name) {
    if (name.substr(0, 2) == "--" && name.find(',') == std::string_view::npos) return;
    throw std::logic_error("an option with a value has one long name, not " + std::string(name));
}

Command& Command::flag(const char* name, const char* about, const std::function<void()>& take) {
    options_.push_back({name, "", about, [take](const std::string&) { take(); }, Need::severalOrNone});
    return *this;
}

Command& Command::flag(const char* name, const char* about, bool& target) {
    return flag(name, about, [&target] { target = true; });
}

Command& Command::exclusive(const char* one, const char* other) {
    exclusive_.emplace_back(one, other);
    return *this;
}

Command& Command::action(std::function<void()> run) {
    run_ = std::move(run);
    return *this;
}

Command& Command::group(const char* heading) {
    groups_.push_back({heading, {}});
    return *this;
}

Command& Command::add(const char* name, const char* about) {
    return *groups_.back().commands.emplace_back(std::make_unique<Command>(name_ + " " + name, about));
}

std::string Command::synopsis() const {
    std::string text = name_;
    if (!groups_.empty()) text += " SUBCOMMAND ...";
    const auto add = [&text](const Parameter& parameter, const std::string& typed) {
        text += isOptional(parameter.need) ? " [" + typed + "]" : " " + typed;
        if (takesSeveral(parameter.need) && parameter.name[0] != '-') text += "...";
    };
    for (const Parameter& argument : arguments_) add(argument, argument.name);
    for (const Parameter& option : options_) {
        add(option, option.name + (*option.value == '\0' ? "" : noBreak + std::string(option.value)));
    }
    return text;
}

std::string Command::help(const std::vector<Parameter>& everywhere) const {
    constexpr unsigned int column = 24;
    std::string text = wrapped(about_ + std::string("."), outputWidth(), 0);
    text += "\n" + wrapped("Usage: " + synopsis(), outputWidth(), 7);
    std::replace(text.begin(), text.end(), noBreak, ' ');
    for (const Group& group : groups_) {
        text += "\n" + std::string(group.heading) + ":\n";
        for (const auto& command : group.commands) {
            text += helpRow(command->name_.substr(name_.size() + 1), command->about_, column);
        }
    }
    const auto list = [&text](const char* heading, const std::vector<Parameter>& parameters) {
        if (!parameters.empty()) text += "\n" + std::string(heading) + ":\n";
        for (const Parameter& parameter : parameters) {
            const std::string value = *parameter.value == '\0' ? "" : std::string(" ") + parameter.value;
            text += helpRow(parameter.name + value, parameter.about, column);
        }
    };
    list("Arguments", arguments_);
    list("Options", options_);
    list("Options everywhere", everywhere);
    return text;
}

Command* Command::find(const std::string& name) const {
    for (const Group& group : groups_) {
        for (const auto& command : group.commands) {
            if (command->name_ == name_ + " " + name) return command.get();
        }
    }
    return nullptr;
}

std::string Command::subcommandNames() const {
    std::string names;
    for (const Group& group : groups_) {
        for (const auto& command : group.commands) {
            names.append(names.empty() ? "" : ", ").append(command->name_, name_.size() + 1);
        }
    }
    return names;
}

void Command::checkWhole() const {
    if (!groups_.empty()) throw UsageError{"a subcommand is missing, one of " + subcommandNames()};
    for (const auto* parameters : {&arguments_, &options_}) {
        for (const Parameter& parameter : *parameters) {
            if (parameter.count == 0 && !isOptional(parameter.need)) {
                throw UsageError{parameter.name + std::string(" is missing")};
            }
        }
    }
    const auto given = [this](std::string_view name) {
        return std::any_of(options_.begin(), options_.end(),
                           [name](const Parameter& option) { return option.name == name && option.count > 0; });
    };
    for (const auto& [one, other] : exclusive_) {
        if (given(one) && given(other)) throw UsageError{std::string(one) + " excludes " + other};
    }
}

void Command::take(Parameter& parameter, const std::string& text) {
    if (parameter.count++ > 0 && !takesSeveral(parameter.need)) {
        throw UsageError{parameter.name + std::string(": given twice")};
    }
    try {
        parameter.take(text);
    } catch (const UsageError& error) {
        throw UsageError{parameter.name + std::string(": '") + text + "': " + error.text};
    }
}

void Command::takeArgument(const std::string& text) {
    for (Parameter& argument : arguments_) {
        if (argument.count == 0 || takesSeveral(argument.need)) return take(argument, text);
    }
    throw UsageError{"unexpected argument: '" + text + "'"};
}

CommandLine::CommandLine(const char* program, const char* about, const char* version)
    : versionText_(version), program_(program, about), everywhere_(program, about) {
    program_.flag("-V, --version", "Print the version and exit", version_);
}

bool CommandLine::run(int argc, char** argv) {
    program_.group("Help")
        .add("help", "Show the help of a subcommand")
        .arguments("SUBCOMMAND", "Its name; without one the program's help is shown", helpOn_,
                   Command::Need::severalOrNone)
        .action([this] { showHelp(); });
    everywhere_.flag("-h, --help", "Show this help and exit", help_);
    try {
        parse(argc > 0 ? argv + 1 : argv);
        if (help_) {
            print(current_->help(everywhere_.options_));
        } else if (version_) {
            print(program_.name_ + " " + versionText_ + "\n");
        } else {
            current_->checkWhole();
            if (prepare_()) current_->run_();
        }
        return true;
    } catch (const UsageError& error) {
        complain(error.text + ". Try '" + current_->name_ + " --help'.");
        return false;
    }
}

void CommandLine::parse(char** arguments) {
    bool optionsEnd = false;
    for (next_ = arguments; *next_ != nullptr && !help_ && !version_;) {
        const std::string text = *next_++;
        if (optionsEnd || text.size() < 2 || text[0] != '-' || std::isdigit(static_cast<unsigned char>(text[1])) != 0) {
            takeArgument(text);
        } else if (text == "--") {
            optionsEnd = true;
        } else if (text[1] == '-') {
            takeLongOption(text);
        } else {
            takeShortOptions(text);
        }
    }
}

void CommandLine::takeArgument(const std::string& text) {
    if (current_->groups_.empty()) return current_->takeArgument(text);
    Command* command = current_->find(text);
    if (command == nullptr) {
        throw UsageError{"unknown subcommand '" + text + "', not one of " + current_->subcommandNames()};
    }
    current_ = command;
}

void CommandLine::takeLongOption(const std::string& text) {
    const auto equals = text.find('=');
    Command::Parameter& option = findOption(text.substr(0, equals), text);
    if (*option.value == '\0') {
        if (equals != std::string::npos) throw UsageError{text.substr(0, equals) + " takes no value: '" + text + "'"};
        return Command::take(option, "");
    }
    if (equals != std::string::npos) return Command::take(option, text.substr(equals + 1));
    if (*next_ == nullptr) throw UsageError{text + " needs a value: " + option.value};
    Command::take(option, *next_++);
}

void CommandLine::takeShortOptions(const std::string& text) {
    for (const char letter : text.substr(1)) Command::take(findOption(std::string("-") + letter, text), "");
}

Command::Parameter& CommandLine::findOption(const std::string& name, const std::string& text) {
    for (auto* options : {&current_->options_, &everywhere_.options_}) {
        for (Command::Parameter& option : *options) {
            if (isOneOf(option.name, name)) return option;
        }
    }
    throw UsageError{"unknown option '" + text + "'"};
}

void CommandLine::showHelp() const {
    const Command* command = &program_;
    for (const std::string& name : helpOn_) {
        command = command->find(name);
        if (command == nullptr) throw UsageError{"unknown subcommand '" + name + "'"};
    }
    print(command->help(everywhere_.options_));
}

}  // namespace epinspect

// The subcommands. Each function adds one to the program: its options, and what is done when it is chosen.
#pragma once

#include <CLI/App.hpp>
#include <string>

#include "Session.h"

namespace epinspect {

/// Adds an option or argument to `command` whose text `parse` turns into `target`, which must outlive the parsing.
template <typename Target, typename Parse>
CLI::Option* addParsed(CLI::App* command, const char* name, const char* about, Target& target, Parse parse) {
    return command
        ->add_option_function<std::string>(
            name, [&target, parse](const std::string& text) { target = parse(text); }, about)
        ->type_name("N");
}

void addDump(CLI::App& app, Session& session);
void addEntry(CLI::App& app, Session& session);
void addMap(CLI::App& app, Session& session);
void addExtent(CLI::App& app, Session& session);
void addLun(CLI::App& app, Session& session);
void addPath(CLI::App& app, Session& session);

}  // namespace epinspect

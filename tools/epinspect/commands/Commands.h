// The subcommands. Each function adds one to `parent`: its arguments and options, and what is done when it is typed.
#pragma once

#include "CommandLine.h"
#include "Session.h"

namespace epinspect {

void addDump(Command& parent, Session& session);
void addEntry(Command& parent, Session& session);
void addMap(Command& parent, Session& session);
void addExtent(Command& parent, Session& session);
void addLun(Command& parent, Session& session);
void addPath(Command& parent, Session& session);

}  // namespace epinspect

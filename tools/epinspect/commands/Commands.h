// The subcommands. Each function adds one to `parent`: its arguments and options, and what is done when it is typed.
#pragma once

#include "frame/CommandLine.h"
#include "frame/Session.h"

namespace epinspect {

void addList(Command& parent, Session& session);
void addDump(Command& parent, Session& session);
void addCheck(Command& parent, Session& session);
void addUsage(Command& parent, Session& session);
void addCollect(Command& parent, Session& session);
void addMap(Command& parent, Session& session);
void addEntry(Command& parent, Session& session);
void addDiff(Command& parent, Session& session);
void addFind(Command& parent, Session& session);
void addLocate(Command& parent, Session& session);
void addOwner(Command& parent, Session& session);
void addRead(Command& parent, Session& session);
void addExtent(Command& parent, Session& session);
void addLun(Command& parent, Session& session);
void addPath(Command& parent, Session& session);

}  // namespace epinspect

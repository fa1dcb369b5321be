// The objects of --json: one a line, keys are the library's member names. Whatever the text dump shows in hexadecimal
// is a "0x" text, every other number a number.
#pragma once

#include <ISCSIEPFile.h>
#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileFRI.h>
#include <ISCSIEPFileJNL.h>
#include <ISCSIEPFileMAP.h>
#include <ISCSIEPFileTBL.h>
#include <ISCSILUNConfInfo.h>

#include <nlohmann/json.hpp>
#include <string>

namespace epinspect {

using Json = nlohmann::ordered_json;

/// An object that starts with "file".
Json fileObject(const std::string& file);

/// Each adds the public members to an object.
void addMembers(Json& object, const ISCSI::TOOL::ISCSIEPFile& file);
void addMembers(Json& object, const ISCSI::TOOL::ISCSIEPFileTBL& file);
void addMembers(Json& object, const ISCSI::TOOL::ISCSIEPFileMAP& file);
void addMembers(Json& object, const ISCSI::TOOL::ISCSIEPFileDAT& file);
void addMembers(Json& object, const ISCSI::TOOL::ISCSIEPFileFRI& file);
void addMembers(Json& object, const ISCSI::TOOL::ISCSIEPFileJNL& file);
void addMembers(Json& object, const ISCSI::TOOL::ISCSIEPMapEntryInfo& entry);
void addMembers(Json& object, const ISCSI::TOOL::ISCSILUNConfInfo& lun);

/// Writes the object as one line of plain ASCII. Throws OutputFailure.
void printJson(const Json& object);

}  // namespace epinspect

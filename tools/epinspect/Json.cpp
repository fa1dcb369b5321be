#include "Json.h"

#include <cstdio>

#include "Output.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

std::string hex(unsigned long long value) {
    char text[19];
    std::snprintf(text, sizeof text, "0x%llx", value);
    return text;
}

}  // namespace

Json fileObject(const std::string& file) { return Json::object({{"file", file}}); }

void addMembers(Json& object, const tool::ISCSIEPFile& file) {
    object["head0Checksum"] = hex(file.head0Checksum);
    object["head0Version"] = file.head0Version;
    object["head0MagicCode"] = hex(file.head0MagicCode);
    object["head0Type"] = file.head0Type;
    object["head0UUID"] = file.head0UUID;
    object["head0DataStartOffset"] = hex(file.head0DataStartOffset);
    object["head0CreateTime"] = file.head0CreateTime;
}

void addMembers(Json& object, const tool::ISCSIEPFileTBL& file) {
    addMembers(object, static_cast<const tool::ISCSIEPFile&>(file));
    object["head1Checksum"] = hex(file.head1Checksum);
    object["extentSize"] = file.extentSize;
    object["entrySize"] = file.entrySize;
    object["totalCount"] = file.totalCount;
}

void addMembers(Json& object, const tool::ISCSIEPFileMAP& file) {
    addMembers(object, static_cast<const tool::ISCSIEPFile&>(file));
    object["head1Checksum"] = hex(file.head1Checksum);
    object["attribute"] = hex(file.attribute);
    object["logicBlockSize"] = file.logicBlockSize;
    object["totalCount"] = file.totalCount;
    object["parentUUID"] = file.parentUUID;
    object["parentTotalCount"] = file.parentTotalCount;
    object["var0Checksum"] = hex(file.var0Checksum);
    object["mappedCount"] = file.mappedCount;
    object["var1Checksum"] = hex(file.var1Checksum);
    object["seg0Checksum"] = hex(file.seg0Checksum);
    object["seg0PoolCount"] = file.seg0PoolCount;
    object["sessionUUID"] = file.sessionUUID;
    object["promoteTime"] = file.promoteTime;
    object["var2Checksum"] = hex(file.var2Checksum);
    object["syncCount"] = file.syncCount;
    object["childAttribute"] = hex(file.childAttribute);
    object["trackUUID"] = file.trackUUID;
    object["previousTrackUUID"] = file.previousTrackUUID;
    object["currentTrackUUID"] = file.currentTrackUUID;
    object["poolUUIDs"] = file.poolUUIDs;
}

void addMembers(Json& object, const tool::ISCSIEPFileDAT& file) {
    addMembers(object, static_cast<const tool::ISCSIEPFile&>(file));
    object["head1Checksum"] = hex(file.head1Checksum);
    object["serialNumber"] = file.serialNumber;
}

void addMembers(Json& object, const tool::ISCSIEPFileFRI& file) {
    addMembers(object, static_cast<const tool::ISCSIEPFile&>(file));
    object["head1Checksum"] = hex(file.head1Checksum);
    object["entrySize"] = file.entrySize;
    object["totalGroupCount"] = hex(file.totalGroupCount);
    object["var0Checksum"] = hex(file.var0Checksum);
    object["totalFreeCount"] = hex(file.totalFreeCount);
    object["indexHead"] = file.indexHead;
}

void addMembers(Json& object, const tool::ISCSIEPFileJNL& file) {
    addMembers(object, static_cast<const tool::ISCSIEPFile&>(file));
    object["head1Checksum"] = hex(file.head1Checksum);
    object["totalCount"] = file.totalCount;
    object["var0Checksum"] = hex(file.var0Checksum);
    object["shutdownTag"] = hex(file.shutdownTag);
    object["syncCount"] = file.syncCount;
    object["var1Checksum"] = hex(file.var1Checksum);
    object["lastTransID"] = file.lastTransID;
    object["lastRecordStart"] = file.lastRecordStart;
    object["lastFlushErrno"] = file.lastFlushErrno;
    object["lastRecoveryError"] = file.lastRecoveryError;
    object["emptyRecordStart"] = file.emptyRecordStart;
}

void addMembers(Json& object, const tool::ISCSIEPMapEntryInfo& entry) {
    object["extentAddress"] = entry.extentAddress;
    object["poolNumber"] = entry.poolNumber;
    object["mapped"] = entry.mapped;
    object["vpushed"] = entry.vpushed;
    object["vpulled"] = entry.vpulled;
    object["synced"] = entry.synced;
}

void addMembers(Json& object, const tool::ISCSILUNConfInfo& lun) {
    object["lid"] = lun.lid;
    object["extentSize"] = lun.extentSize;
    object["size"] = lun.size;
    object["restoreTime"] = lun.restoreTime;
    object["type"] = lun.type;
    object["uuid"] = lun.uuid;
    object["rootPath"] = lun.rootPath;
    object["name"] = lun.name;
}

void printJson(const Json& object) {
    print(object.dump(-1, ' ', true, Json::error_handler_t::replace));
    print("\n");
}

}  // namespace epinspect

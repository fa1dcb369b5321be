#include "store/HeaderFields.h"

#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileFRI.h>
#include <ISCSIEPFileJNL.h>
#include <ISCSIEPFileMAP.h>
#include <ISCSIEPFileTBL.h>

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

class Fields {
public:
    Fields& number(const char* name, std::uint64_t value) { return add({name, HeaderField::Form::number, value}); }
    Fields& hex(const char* name, std::uint64_t value) { return add({name, HeaderField::Form::hexadecimal, value}); }
    Fields& time(const char* name, std::uint64_t value) { return add({name, HeaderField::Form::time, value}); }
    Fields& text(const char* name, const std::string& value) {
        return add({name, HeaderField::Form::text, 0, {value}});
    }
    Fields& texts(const char* name, const std::vector<std::string>& values) {
        return add({name, HeaderField::Form::texts, 0, values});
    }

    std::vector<HeaderField> all;

private:
    Fields& add(const HeaderField& field) {
        all.push_back(field);
        return *this;
    }
};

void add(Fields& fields, const tool::ISCSIEPFileTBL& file) {
    fields.hex("head1Checksum", file.head1Checksum)
        .number("extentSize", file.extentSize)
        .number("entrySize", file.entrySize)
        .number("totalCount", file.totalCount);
}

void add(Fields& fields, const tool::ISCSIEPFileMAP& file) {
    fields.hex("head1Checksum", file.head1Checksum)
        .hex("attribute", file.attribute)
        .number("logicBlockSize", file.logicBlockSize)
        .number("totalCount", file.totalCount)
        .text("parentUUID", file.parentUUID)
        .number("parentTotalCount", file.parentTotalCount)
        .hex("var0Checksum", file.var0Checksum)
        .number("mappedCount", file.mappedCount)
        .hex("var1Checksum", file.var1Checksum)
        .hex("seg0Checksum", file.seg0Checksum)
        .number("seg0PoolCount", file.seg0PoolCount)
        .text("sessionUUID", file.sessionUUID)
        .time("promoteTime", file.promoteTime)
        .hex("var2Checksum", file.var2Checksum)
        .number("syncCount", file.syncCount)
        .hex("childAttribute", file.childAttribute)
        .text("trackUUID", file.trackUUID)
        .text("previousTrackUUID", file.previousTrackUUID)
        .text("currentTrackUUID", file.currentTrackUUID)
        .texts("poolUUIDs", file.poolUUIDs);
}

void add(Fields& fields, const tool::ISCSIEPFileDAT& file) {
    fields.hex("head1Checksum", file.head1Checksum).number("serialNumber", file.serialNumber);
}

void add(Fields& fields, const tool::ISCSIEPFileFRI& file) {
    fields.hex("head1Checksum", file.head1Checksum)
        .number("entrySize", file.entrySize)
        .hex("totalGroupCount", file.totalGroupCount)
        .hex("var0Checksum", file.var0Checksum)
        .hex("totalFreeCount", file.totalFreeCount)
        .number("indexHead", file.indexHead);
}

void add(Fields& fields, const tool::ISCSIEPFileJNL& file) {
    fields.hex("head1Checksum", file.head1Checksum)
        .number("totalCount", file.totalCount)
        .hex("var0Checksum", file.var0Checksum)
        .hex("shutdownTag", file.shutdownTag)
        .number("syncCount", file.syncCount)
        .hex("var1Checksum", file.var1Checksum)
        .number("lastTransID", file.lastTransID)
        .number("lastRecordStart", file.lastRecordStart)
        .number("lastFlushErrno", file.lastFlushErrno)
        .number("lastRecoveryError", file.lastRecoveryError)
        .number("emptyRecordStart", file.emptyRecordStart);
}

/// Adds the fields of the class File where `file` is of it.
template <typename File>
void addIfOf(Fields& fields, const tool::ISCSIEPFile& file) {
    if (const auto* own = dynamic_cast<const File*>(&file)) add(fields, *own);
}

}  // namespace

std::vector<HeaderField> headerFieldsOf(const tool::ISCSIEPFile& file) {
    Fields fields;
    fields.hex("head0Checksum", file.head0Checksum)
        .number("head0Version", file.head0Version)
        .hex("head0MagicCode", file.head0MagicCode)
        .number("head0Type", file.head0Type)
        .text("head0UUID", file.head0UUID)
        .hex("head0DataStartOffset", file.head0DataStartOffset)
        .time("head0CreateTime", file.head0CreateTime);
    addIfOf<tool::ISCSIEPFileTBL>(fields, file);
    addIfOf<tool::ISCSIEPFileMAP>(fields, file);
    addIfOf<tool::ISCSIEPFileDAT>(fields, file);
    addIfOf<tool::ISCSIEPFileFRI>(fields, file);
    addIfOf<tool::ISCSIEPFileJNL>(fields, file);
    return fields.all;
}

}  // namespace inspection

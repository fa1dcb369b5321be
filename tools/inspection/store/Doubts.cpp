#include "store/Doubts.h"

#include <charconv>

#include "map/EntryBits.h"
#include "store/FileSize.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

std::optional<KindDoubt> kindDoubtOf(const tool::ISCSIEPFile& file, const FileKind* byName) {
    const FileKind* byType = kindByType(file.head0Type);
    if (byName == nullptr || byName == byType || (byName->type == 0 && byType == nullptr)) return std::nullopt;
    return KindDoubt{byName, file.head0Type, byType};
}

std::optional<DataStartDoubt> dataStartDoubtOf(const tool::ISCSIEPFile& file, std::optional<std::uint64_t> size) {
    if (file.head0DataStartOffset < tool::EP_HEADER_BLOCK_SIZE) return DataStartDoubt{true, tool::EP_HEADER_BLOCK_SIZE};
    if (size && file.head0DataStartOffset > *size) return DataStartDoubt{false, *size};
    return std::nullopt;
}

std::optional<PartialEntry> partialEntryOf(const tool::ISCSIEPFile& file, std::optional<std::uint64_t> size) {
    const std::uint64_t bytes = payloadOf(file, size.value_or(0));
    if (bytes % entrySize == 0) return std::nullopt;
    return PartialEntry{bytes / entrySize, bytes % entrySize};
}

void remarkOnKind(Context& context, const tool::ISCSIEPFile& file, const std::string& name, const FileKind* byName) {
    const auto doubt = kindDoubtOf(file, byName);
    if (!doubt) return;
    context.remark(name, std::string("named like a ") + byName->title + ", but its type in HEAD[0] is " +
                             std::to_string(doubt->type) +
                             (doubt->byType != nullptr ? std::string(", a ") + doubt->byType->title : ""));
}

void remarkOnDataStart(Context& context, const tool::ISCSIEPFile& file, const std::string& name) {
    const auto doubt = dataStartDoubtOf(file, context.sizeOf(file.path));
    if (!doubt) return;
    char digits[16];
    const auto end = std::to_chars(digits, digits + sizeof digits, file.head0DataStartOffset, 16).ptr;
    context.remark(name, "data start offset 0x" + std::string(digits, end) + " lies " +
                             (doubt->insideHeader ? "inside the header block" : "past the end of the file"));
}

void remarkOnPartialEntry(Context& context, const tool::ISCSIEPFile& file, const std::string& name) {
    const auto partial = partialEntryOf(file, context.sizeOf(file.path));
    if (!partial) return;
    context.remark(name, "ends inside an entry, " + std::to_string(partial->bytes) + " of its " +
                             std::to_string(entrySize) + " bytes are there");
}

}  // namespace inspection

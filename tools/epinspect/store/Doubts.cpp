#include "store/Doubts.h"

#include "Output.h"
#include "Text.h"
#include "store/FileSize.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

void sayKindDoubts(const tool::ISCSIEPFile& file, const std::string& name, const FileKind* byName) {
    const FileKind* byType = kindByType(file.head0Type);
    if (byName == nullptr || byName == byType || (byName->type == 0 && byType == nullptr)) return;
    complain(name + ": named like a " + byName->title + ", but its type in HEAD[0] is " +
             std::to_string(file.head0Type) + (byType != nullptr ? std::string(", a ") + byType->title : ""));
}

void sayDataStartDoubts(const tool::ISCSIEPFile& file, const std::string& name) {
    const auto size = sizeOf(file.path);
    const char* doubt = nullptr;
    if (file.head0DataStartOffset < tool::EP_HEADER_BLOCK_SIZE) {
        doubt = "inside the header block";
    } else if (size && file.head0DataStartOffset > *size) {
        doubt = "behind the end of the file";
    }
    if (doubt == nullptr) return;
    Text offset;
    offset.hexadecimal(file.head0DataStartOffset);
    complain(name + ": data start offset " + std::string(offset.view()) + " lies " + doubt);
}

void sayPartialEntry(const tool::ISCSIEPFile& file, const std::string& name) {
    constexpr unsigned int entrySize = 8;
    const auto size = sizeOf(file.path);
    if (!size || *size <= file.head0DataStartOffset) return;
    const auto rest = (*size - file.head0DataStartOffset) % entrySize;
    if (rest > 0) complain(name + ": ends inside an entry, " + std::to_string(rest) + " of its 8 bytes are there");
}

}  // namespace epinspect

// What differs between two files of one kind, and which files only one of two stores has.
#pragma once

#include <ISCSIEPFile.h>

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "map/MapDiff.h"
#include "store/Context.h"
#include "store/FileKind.h"
#include "store/HeaderFields.h"
#include "store/OpenMap.h"
#include "store/Store.h"

namespace inspection {

/// A file whose header block is decoded.
struct OpenedHeader {
    const FileKind* kind = nullptr;
    std::unique_ptr<ISCSI::TOOL::ISCSIEPFile> file;  ///< null after a failure
};

/// Decodes the header block of the file that messages call `name`. Its kind follows from its type, else from its name;
/// where neither tells one, only HEAD[0] is decoded, with a remark. Reports failures.
OpenedHeader openHeader(Context& context, const std::string& name, NamedBy by);

/// A field that two header blocks hold different values of.
using FieldDifference = std::pair<HeaderField, HeaderField>;

/// The fields in which two files of one kind differ.
std::vector<FieldDifference> fieldDifferencesOf(const ISCSI::TOOL::ISCSIEPFile& a, const ISCSI::TOOL::ISCSIEPFile& b);

/// A map whose entries are compared, and the name that the user gave it.
struct ComparedMap {
    Context& context;
    const std::string& name;
    OpenedMap map;
};

/// Gives the runs of differing entries of two maps to each(). Returns whether all entries could be read; reports to the
/// context of the map what could not.
bool compareEntries(ComparedMap& a, ComparedMap& b, const std::function<void(const DiffRun&)>& each);

/// A file that two stores have at the same path, or only one of them.
struct FilePair {
    std::optional<StoreFile> a, b;

    const StoreFile& any() const { return a ? *a : *b; }
};

/// The files of two stores, in the order of Store::forEachFile(). Files that are missing are left out.
std::vector<FilePair> pairFiles(Store& a, Store& b);

}  // namespace inspection

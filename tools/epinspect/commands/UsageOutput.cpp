#include "commands/UsageOutput.h"

#include <limits>

#include "commands/Chart.h"
#include "commands/MapOutput.h"
#include "commands/TextTable.h"
#include "frame/Json.h"
#include "frame/Output.h"
#include "store/FileNames.h"

namespace epinspect {

namespace {

/// What a number of extents is sure to be.
enum class Bound { exact, atMost, atLeast };

/// What is known of a figure that would be too small, or too large, if not all maps could be read.
Bound atLeast(const ExtentsInUse& use) { return use.isComplete() ? Bound::exact : Bound::atLeast; }
Bound atMost(const ExtentsInUse& use) { return use.isComplete() ? Bound::exact : Bound::atMost; }

/// The same of what no map claims: extents of other sizes may lie there.
Bound unclaimedBound(const ExtentsInUse& use) { return use.hasOtherSizes() ? Bound::atMost : atMost(use); }

/// The cells of numbers of things, and below them of their bytes.
class Figures {
public:
    explicit Figures(const ExtentsInUse& use) : use_(use) {}

    Figures& add(const std::optional<std::uint64_t>& count, Bound bound = Bound::exact) {
        const char* prefix = "";
        if (bound == Bound::atMost) prefix = "at most ";
        if (bound == Bound::atLeast) prefix = "at least ";
        counts_.push_back(count ? prefix + std::to_string(*count) : "unknown");
        const auto size = use_.extentSize();
        bytes_.push_back(count && size ? prefix + sizeText(static_cast<double>(*count) * *size) : "");
        return *this;
    }

    void addTo(TextTable& table, const std::string& name) {
        counts_[0] = name;
        table.add(counts_);
        if (use_.extentSize()) table.add(bytes_);
    }

private:
    const ExtentsInUse& use_;
    std::vector<std::string> counts_ = {""};
    std::vector<std::string> bytes_ = {""};
};

std::string titleOf(const ExtentsInUse& use) {
    const auto size = use.extentSize();
    const std::string& folder = use.volume().folder;
    return forReader(folder.empty() ? "/" : folder) + ", extents of " +
           (size ? counted(*size, "byte", "bytes") : "unknown size") + "\n";
}

void addMaps(TextTable& table, const ExtentsInUse& use) {
    bool heading = false;
    for (const MapUse& map : use.maps()) {
        if (!map.map->asked || !map.read) continue;
        if (!heading) table.add({"", "entries", "mapped", "extents", "alone", "shared"});
        heading = true;
        const StoreFile& file = map.map->file;
        if (file.luns.empty()) table.addLine(forReader(file.path));
        Figures figures(use);
        figures.add(map.entries).add(map.mapped).add(map.extents);
        figures.add(map.alone(), atMost(use)).add(map.shared, atLeast(use));
        figures.addTo(table, file.luns.empty() ? "" : lunsText(lidsOf(file.luns)));
    }
}

void addDataFiles(TextTable& table, const ExtentsInUse& use) {
    if (use.dataFiles().empty()) return;
    table.add({"", "holds", "in use", "unclaimed", "shared", "past end"});
    for (const DataFileUse& file : use.dataFiles()) {
        Figures figures(use);
        figures.add(file.extents).add(file.used, atLeast(use));
        figures.add(file.extents ? std::optional(file.unclaimed()) : std::nullopt, unclaimedBound(use));
        figures.add(file.shared, atLeast(use));
        figures.add(file.extents ? std::optional(file.beyond) : std::nullopt, atLeast(use));
        figures.addTo(table, std::string(lastName(file.path)));
    }
}

/// "NAME": that many extents of the size, or null; and "NAMEBytes". Where the figure is not sure to be so, the first
/// two are null and "NAMEAtMost" or "NAMEAtLeast" is there instead.
void write(Json& json, const std::string& name, std::optional<std::uint64_t> count, const ExtentsInUse& use,
           Bound bound = Bound::exact) {
    const auto writeNumber = [&json](const std::string& key, const std::optional<std::uint64_t>& number) {
        if (number) {
            json.number(std::string_view(key), *number);
        } else {
            json.null(std::string_view(key));
        }
    };
    if (bound != Bound::exact && count) {
        writeNumber(name + (bound == Bound::atMost ? "AtMost" : "AtLeast"), count);
        count.reset();
    }
    const auto size = use.extentSize();
    const bool fits = count && size && *count <= std::numeric_limits<std::uint64_t>::max() / *size;
    writeNumber(name, count);
    writeNumber(name + "Bytes", fits ? std::optional(*count * *size) : std::nullopt);
}

void writeExtentSize(Json& json, const ExtentsInUse& use) {
    if (const auto size = use.extentSize()) {
        json.number("extentSize", *size);
    } else {
        json.null("extentSize");
    }
}

}  // namespace

void UsageOutput::print(const ExtentsInUse& use) {
    if (session_.json) {
        printAsJson(use);
    } else {
        TextTable table;
        addMaps(table, use);
        addDataFiles(table, use);
        epinspect::print(titleOf(use) + table.text());
    }
    for (const MapUse& map : use.maps()) {
        if (!map.map->asked || !map.read) continue;
        ++maps_;
        mapped_ += map.mapped;
    }
    for (const DataFileUse& file : use.dataFiles()) {
        dataFiles_.insert(file.path);
        if (chart_ && file.extents) drawDataFile(use, file);
    }
    isSure_ = isSure_ && use.isComplete();
    extents_ += use.askedExtents();
    shared_ += use.askedShared();
}

void UsageOutput::printAsJson(const ExtentsInUse& use) {
    for (const MapUse& map : use.maps()) {
        if (map.map->asked && map.read) writeMap(use, map);
    }
    for (const DataFileUse& file : use.dataFiles()) writeDataFile(use, file);
}

void UsageOutput::writeMap(const ExtentsInUse& use, const MapUse& map) {
    Json json(map.map->file.path, lidsOf(map.map->file.luns));
    json.begin("lunUsage");
    writeExtentSize(json, use);
    write(json, "entries", map.entries, use);
    write(json, "mapped", map.mapped, use);
    json.number("ambiguous", map.ambiguous);
    write(json, "extents", map.extents, use);
    write(json, "alone", map.alone(), use, atMost(use));
    write(json, "shared", map.shared, use, atLeast(use));
    json.end();
}

void UsageOutput::writeDataFile(const ExtentsInUse& use, const DataFileUse& file) {
    Json json(file.path);
    json.begin("dataFileUsage");
    writeExtentSize(json, use);
    const auto known = [&file](std::uint64_t count) { return file.extents ? std::optional(count) : std::nullopt; };
    write(json, "extents", file.extents, use);
    write(json, "used", file.used, use, atLeast(use));
    write(json, "shared", file.shared, use, atLeast(use));
    write(json, "unclaimed", known(file.unclaimed()), use, unclaimedBound(use));
    write(json, "beyond", known(file.beyond), use, atLeast(use));
    json.end();
}

void UsageOutput::drawDataFile(const ExtentsInUse& use, const DataFileUse& file) {
    Chart chart(0, *file.extents, outputWidth());
    std::uint64_t next = file.firstExtent;
    const auto fill = [&](std::uint64_t first, std::uint64_t count) {
        chart.add(false, first - next);
        chart.add(true, count);
        next = first + count;
    };
    use.used().forEachIn(file.firstExtent, *file.extents, fill);
    chart.add(false, file.firstExtent + *file.extents - next);
    use.shared().forEachIn(file.firstExtent, *file.extents, [&](std::uint64_t first, std::uint64_t count) {
        chart.mark(first - file.firstExtent, count);
    });
    epinspect::print(forReader(file.path) + "\n" + chart.draw(outputIsUnicode(), "extent", "extents"));
}

void UsageOutput::printSummary() const {
    if (session_.json) {
        Json json("");
        json.begin("summary")
            .boolean("summary", true)
            .number("maps", maps_)
            .number("dataFiles", dataFiles_.size())
            .number("mapped", mapped_)
            .number("extents", extents_)
            .number("shared", shared_);
        if (!isSure_) json.number("sharedAtLeast", shared_);
        json.texts("changed", session_.changedFiles());
        if (!isAll_) json.boolean("incomplete", true);
        json.end();
        return;
    }
    if (chart_) epinspect::print(Chart::legend(outputIsUnicode(), outputWidth(), "In use", "some shared"));
    epinspect::print(wrapped((isAll_ ? "" : "without what could not be counted: ") + counted(maps_, "map", "maps") +
                                 ", " + counted(dataFiles_.size(), "data file", "data files") + ": " +
                                 counted(mapped_, "entry", "entries") + " mapped, " +
                                 counted(extents_, "extent", "extents") + " in use, " + (isSure_ ? "" : "at least ") +
                                 std::to_string(shared_) + " shared by several maps",
                             outputWidth(), 0));
}

}  // namespace epinspect

// The plugin for nbdkit: a LUN as a read-only disk for everything that speaks NBD. It only joins the two: what a LUN
// holds and what the parameters mean is known to the inspection library.
#define NBDKIT_API_VERSION 2
#include <nbdkit-plugin.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <limits>
#include <memory>
#include <new>
#include <optional>
#include <set>
#include <string>

#include "Failure.h"
#include "store/Context.h"
#include "store/LunBytes.h"
#include "store/LunMap.h"

// Connections read at once, each by itself.
#define THREAD_MODEL NBDKIT_THREAD_MODEL_SERIALIZE_REQUESTS

namespace {

using namespace inspection;

/// Failures and remarks go to nbdkit's log.
class PluginContext : public Context {
public:
    void remark(const std::string& subject, const std::string& text) override {
        nbdkit_error("%s: %s", subject.c_str(), text.c_str());
    }
    void progress(const char* /*things*/, std::uint64_t /*done*/, std::uint64_t /*total*/) override {}
    void trying(bool /*begins*/) override {}

protected:
    void report(const Failure& failure) override { nbdkit_error("%s", messageOf(failure).c_str()); }
};

/// The parameters, and the LUN that they lead to.
struct Served {
    PluginContext context;
    std::set<std::string> given;  ///< names of the parameters
    std::optional<LunName> name;
    std::optional<std::uint32_t> extentSize;
    PlaceChoice choice;
    std::optional<LunMap> lun;  ///< from get_ready on
};

std::unique_ptr<Served> served;

/// What one client reads with.
struct Connection {
    Connection() : lun(served->lun->copy()), bytes(context, lun, served->choice) {
        context.root = served->context.root;
        context.collection = served->context.collection;
    }

    PluginContext context;
    LunMap lun;
    LunBytes bytes;
};

/// The result of `work`, or of a failure where it throws: nothing may be thrown into nbdkit.
template <typename Result, typename Work>
Result guarded(Result failure, const Work& work) noexcept {
    try {
        return work();
    } catch (const std::bad_alloc&) {
        nbdkit_error("out of memory");
        nbdkit_set_error(ENOMEM);
    } catch (const std::exception& error) {
        nbdkit_error("%s", error.what());
        nbdkit_set_error(EIO);
    }
    return failure;
}

void load() {
    guarded(0, [] {
        served = std::make_unique<Served>();
        return 0;
    });
}

void unload() { served.reset(); }

/// Takes what was typed; returns what is wrong with it.
template <typename Target, typename Value>
std::string take(Target& target, const Typed<Value>& typed) {
    if (typed.fault != nullptr) return typed.fault;
    target = typed.value;
    return {};
}

/// `path` whatever folder nbdkit goes to later.
std::string absolute(const char* path) {
    const std::unique_ptr<char, decltype(&std::free)> text(nbdkit_absolute_path(path), std::free);
    return text != nullptr ? text.get() : "";
}

std::string takeRoot(const char* value) {
    const std::error_code error = served->context.setRoot(absolute(value));
    if (error) return error.message();
    const auto& damaged = served->context.damagedCollection;
    return damaged ? messageOf(*damaged) : "";
}

std::string takeParameter(const std::string& key, const char* value) {
    if (key == "lun") return take(served->name, lunNameIn(value));
    if (key == "root") return takeRoot(value);
    if (key == "extent-size") return take(served->extentSize, extentSizeIn(value));
    if (key == "address-bits") return take(served->choice.addressBits, addressBitsIn(value));
    if (key == "count-from") return take(served->choice.countFrom, countFromIn(value));
    return "no such parameter; there are lun, root, extent-size, address-bits and count-from";
}

int config(const char* key, const char* value) {
    return guarded(-1, [key, value] {
        const bool first = served->given.insert(key).second;
        const std::string fault = first ? takeParameter(key, value) : "given twice";
        if (fault.empty()) return 0;
        nbdkit_error("%s: '%s': %s", key, value, fault.c_str());
        return -1;
    });
}

int configComplete() {
    if (served->name) return 0;
    nbdkit_error("lun is missing: the id of a LUN, or the path of its map file");
    return -1;
}

/// Before nbdkit leaves its folder, and before there are threads.
int getReady() {
    return guarded(-1, [] {
        LunName& name = *served->name;
        const TargetRoot& root = served->context.root;
        if (!name.lid) name.file = root.isFolder() ? root.targetPath(name.file) : absolute(name.file.c_str());
        served->lun = openLunMap(served->context, name, served->extentSize);
        return served->lun ? 0 : -1;
    });
}

Connection* connectionOf(void* handle) { return static_cast<Connection*>(handle); }

void* openConnection(int /*readonly*/) {
    return guarded<void*>(nullptr, [] { return new Connection; });
}

void closeConnection(void* handle) { delete connectionOf(handle); }

std::int64_t getSize(void* handle) {
    constexpr std::uint64_t most = std::numeric_limits<std::int64_t>::max();
    return static_cast<std::int64_t>(std::min(connectionOf(handle)->lun.size, most));
}

/// Nothing is ever written, so all connections see the same.
int canMultiConnect(void* /*handle*/) { return 1; }

int readBytes(void* handle, void* buffer, std::uint32_t count, std::uint64_t offset, std::uint32_t /*flags*/) {
    return guarded(-1, [=] {
        LunBytes& bytes = connectionOf(handle)->bytes;
        const bool all = bytes.read(offset, count, static_cast<unsigned char*>(buffer), [&bytes](const LunPart& part) {
            nbdkit_error("%s", messageOf(bytes.failureOf(part)).c_str());
            return false;
        });
        if (!all) nbdkit_set_error(EIO);
        return all ? 0 : -1;
    });
}

/// What cannot be read counts as data, so that whoever wants it gets the error.
int getExtents(void* handle, std::uint32_t count, std::uint64_t offset, std::uint32_t flags, nbdkit_extents* extents) {
    return guarded(-1, [=] {
        std::optional<std::uint32_t> first;
        int result = 0;
        connectionOf(handle)->bytes.forEachPart(offset, count, [&](const LunPart& part) {
            const std::uint32_t type = part.kind == LunPart::Kind::hole ? NBDKIT_EXTENT_HOLE | NBDKIT_EXTENT_ZERO : 0;
            if ((flags & NBDKIT_FLAG_REQ_ONE) != 0 && first.value_or(type) != type) return false;
            first = type;
            result = nbdkit_add_extent(extents, part.offset, part.length, type);
            return result == 0;
        });
        return result;
    });
}

nbdkit_plugin describePlugin() {
    nbdkit_plugin plugin = {};
    plugin.name = "ep";
    plugin.longname = "nbdkit EP plugin";
    plugin.version = PLUGIN_VERSION;
    plugin.description = "A LUN of an iSCSI store, put together from its EP files, as a read-only disk";
    plugin.load = load;
    plugin.unload = unload;
    plugin.config = config;
    plugin.config_complete = configComplete;
    plugin.magic_config_key = "lun";
    plugin.config_help =
        "lun=ID|MAPFILE           (required) The LUN: its id, or the path of its map file.\n"
        "root=DIR                 Folder that stands for / of the target.\n"
        "extent-size=SIZE         Bytes of an extent (default: as configured).\n"
        "address-bits=48|52       How many bits of an entry are its extent address.\n"
        "count-from=file|volume   From where extents are counted.";
    plugin.get_ready = getReady;
    plugin.open = openConnection;
    plugin.close = closeConnection;
    plugin.get_size = getSize;
    plugin.can_multi_conn = canMultiConnect;
    plugin.pread = readBytes;
    plugin.extents = getExtents;
    return plugin;
}

nbdkit_plugin plugin = describePlugin();

}  // namespace

NBDKIT_REGISTER_PLUGIN(plugin)

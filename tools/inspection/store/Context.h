// What every look at a store needs: where the store lies, and a place for failures, remarks and progress to go.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "Failure.h"
#include "store/Collection.h"
#include "store/TargetRoot.h"

namespace inspection {

/// Where the name of a file comes from: typed by the user, or a path of the target.
enum class NamedBy { user, target };

/// Where the stand-in for the platform's library looks for its list of LUNs.
inline constexpr const char* lunListPath = "/var/db/iscsi/luns.json";

/// Each program derives one from this. Used by one thread at a time.
class Context {
public:
    Context() = default;
    Context(const Context&) = delete;
    Context& operator=(const Context&) = delete;
    virtual ~Context() = default;

    TargetRoot root;

    /// Set where the root folder is a collection.
    std::optional<Collection> collection;

    /// Makes `folder` stand for / of the target, and reads what it says as a collection, if it is one. Returns why it
    /// cannot; the root then stays as it was.
    std::error_code setRoot(const std::string& folder);

    /// The failure to read the folder as a collection, which is damaged.
    std::optional<Failure> damagedCollection;

    /// Bytes of the file or device at `hostPath`, of a collection those that it has on the target. Nothing when that
    /// cannot be told; errno then says why.
    std::optional<std::uint64_t> sizeOf(const std::string& hostPath) const;

    /// Something failed; everything else that was asked for goes on.
    void failed(const Failure& failure) {
        ++failures_;
        report(failure);
    }

    /// How often that was so: a work that leaves the number as it was has seen all that it looked for.
    std::uint64_t failures() const { return failures_; }

    /// There is something to know about `subject` that is no failure.
    virtual void remark(const std::string& subject, const std::string& text) = 0;

    /// Of a long work, `done` of `total` of `things` ("entries") are done. Called now and then.
    virtual void progress(const char* things, std::uint64_t done, std::uint64_t total) = 0;

    /// Whether a long work is to end early, because the user wants so.
    virtual bool interrupted() { return false; }

    /// Something is only tried out, until the call with false: nobody needs to see the library's log lines about it.
    /// May be nested.
    virtual void trying(bool begins) = 0;

    /// The file that the user called `name` has changed while it was read. Remarks on it, once per file.
    virtual void changed(const std::string& name);

    /// Whether changed() was called for it.
    bool hasChanged(const std::string& name) const;

    /// All such files, in the order of the calls.
    const std::vector<std::string>& changedFiles() const { return changedFiles_; }

    /// The log lines since a trial began, or since the last call: a failure that the trial ends in takes them along.
    virtual std::vector<std::string> takeTrialLog() { return {}; }

    /// Reports the failure of a call of the library, right after it (the system's reason is still in errno), when
    /// `error` is not 0. Returns whether it is 0.
    bool succeeded(int error, const Subject& subject);

    /// Reports a failure that the library does not know, under its code that fits.
    void fail(const Subject& subject, std::string_view what, int error);

    /// Where to open the file that messages call `name`. Nothing, and a failure, when what lies there must not be
    /// opened or, below a root folder, cannot be looked at. A missing file is no failure yet: the library will not find
    /// it.
    std::optional<std::string> openablePath(const std::string& name, NamedBy by);

    /// To be called before every look at a LUN: the LUN list is then the one below the root folder, unless the
    /// environment names another.
    void prepareLuns();

    /// Whether the environment names the list of LUNs: the user's choice, which is to be there.
    static bool isListNamed();

protected:
    /// Lets the user know of a failure.
    virtual void report(const Failure& failure) = 0;

private:
    std::uint64_t failures_ = 0;
    std::optional<std::string> lunList_;  ///< where the list below the root folder lies
    std::vector<std::string> changedFiles_;
};

/// While one lives, things are only tried out.
class Trial {
public:
    explicit Trial(Context& context) : context_(context) { context_.trying(true); }
    Trial(const Trial&) = delete;
    Trial& operator=(const Trial&) = delete;
    ~Trial() { context_.trying(false); }

private:
    Context& context_;
};

}  // namespace inspection

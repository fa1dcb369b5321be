// What holds for a whole run of epinspect: the options every subcommand takes, and how it went so far.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "frame/Inspection.h"
#include "frame/Progress.h"
#include "frame/SystemLog.h"
#include "store/Context.h"

namespace epinspect {

class Session : public Context {
public:
    bool json = false;         ///< --json: failures are objects on standard output too
    bool differences = false;  ///< all was read, and there are findings or differences
    bool listing = true;       ///< lines go to standard output while a long work goes on

    /// Makes `folder` stand for / of the target; from then on nothing goes to the system log. Throws UsageError when it
    /// cannot.
    void setRoot(const std::string& folder);

    /// Where the root is a collection: says so on standard error, and when it was made.
    void remarkOnCollection();

    /// Reports a failure as a message alone: the caller prints an object that says more.
    void complainOf(const Failure& failure);

    void remark(const std::string& subject, const std::string& text) override;
    void progress(const char* things, std::uint64_t done, std::uint64_t total) override;
    void trying(bool begins) override;
    bool interrupted() override;
    std::vector<std::string> takeTrialLog() override { return takeHeldLines(); }

    /// Erases the line that shows the progress, for good.
    void endProgress() { progress_.reset(); }

    /// The exit status that the run so far amounts to.
    int status() const;

protected:
    /// Prints the message, as an object too with --json. The exit status is 1 from then on. Throws OutputFailure.
    void report(const Failure& failure) override;

private:
    bool failed_ = false;
    std::optional<QuietLog> quiet_;
    unsigned int trials_ = 0;
    std::optional<HeldLog> trialLog_;
    std::optional<Progress> progress_;
};

}  // namespace epinspect

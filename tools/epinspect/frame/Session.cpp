#include "frame/Session.h"

#include <etc/ISCSIEPDiagnostics.h>
#include <etc/ISCSIQuorinStringTool.h>

#include "frame/Interruption.h"
#include "frame/Json.h"
#include "frame/Output.h"
#include "frame/UsageError.h"

namespace epinspect {

namespace {

std::vector<std::uint32_t> lidsOf(const Subject& subject) {
    if (!subject.lid) return {};
    return {*subject.lid};
}

}  // namespace

void Session::setRoot(const std::string& folder) {
    const std::error_code error = Context::setRoot(folder);
    if (error == std::errc::not_a_directory) throw UsageError{"not a folder"};
    if (error) throw UsageError{error.message()};
    quiet_.emplace();
}

void Session::remarkOnCollection() {
    if (!collection) return;
    const auto time = static_cast<unsigned int>(collection->time);
    remark(root.hostPath(""),
           "a collection of " + ISCSI::TOOL::GetTimeInString(time) + ", without data, made by " + collection->program);
}

void Session::report(const Failure& failure) {
    complainOf(failure);  // first, for standard output may be lost
    if (!json) return;
    const Subject& subject = failure.subject;
    Json object(subject.file.empty() ? subject.map : subject.file, lidsOf(subject));
    object.begin("error");
    if (const char* name = ISCSI::TOOL::GetErrorName(failure.error)) {
        object.text("error", name);
    } else {
        object.null("error");
    }
    object.number("code", failure.error).text("message", messageOf(failure)).end();
}

void Session::complainOf(const Failure& failure) {
    failed_ = true;
    for (const std::string& line : failure.log) complain(line);
    complain(messageOf(failure));
}

void Session::remark(const std::string& subject, const std::string& text) { complain(subject + ": " + text); }

void Session::progress(const char* things, std::uint64_t done, std::uint64_t total) {
    if (!progress_ || !progress_->isOf(things, total)) {
        progress_.reset();
        progress_.emplace(things, total, listing ? Progress::Beside::listing : Progress::Beside::nothing);
    }
    progress_->show(done);
    if (done == total) progress_.reset();
}

void Session::trying(bool begins) {
    trials_ += begins ? 1U : -1U;
    if (trials_ == 0) {
        trialLog_.reset();
    } else if (!trialLog_) {
        trialLog_.emplace();
    }
}

bool Session::interrupted() { return isInterrupted(); }

int Session::status() const {
    if (failed_) return 1;
    return differences ? 3 : 0;
}

}  // namespace epinspect

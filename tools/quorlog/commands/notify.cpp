// notify test.
#include <unistd.h>

#include <cerrno>

#include "base/paths.h"
#include "quor/quornotify.h"
#include "store/denial.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

void setup(CLI::App& command, OutputOptions& output) {
    AddOutputOptions(command, output);
}

struct Deliveries {
    RowSink& sink;
    int failed = 0;
};

void reportDelivery(const char* channel, int ok, const char* detail, void* context) {
    auto& deliveries = *static_cast<Deliveries*>(context);
    deliveries.failed += ok == 0 ? 1 : 0;
    deliveries.sink.row({channel, ok != 0 ? "sent" : "failed", detail});
}

int reportNoChannel() {
    Complain(std::string("no channel for notices is set up in ") + paths::kSystemSettings +
             ", so matches of the rules become events only; see quorinfo.conf(5)");
    return kNothing;
}

int run(const OutputOptions& options) {
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(options.style(), {{"channel"}, {"outcome"}, {"cause"}}, out);
    Deliveries deliveries{*sink};
    const int tried = QUORNotifyTest(reportDelivery, &deliveries);
    if (tried < 0 && access(paths::kSystemSettings, R_OK) != 0 && errno == EACCES) {
        throw Failure(store::WhyDenied(paths::kSystemSettings), store::Cause::Denied);
    }
    if (tried < 0) {
        throw Failure(std::string("cannot read ") + paths::kSystemSettings + "; create it and name the channels there");
    }
    if (tried == 0) {
        return reportNoChannel();
    }
    sink->finish();
    if (deliveries.failed != 0) {
        throw Failure(std::to_string(deliveries.failed) + " of " + std::to_string(tried) +
                      " channels failed; correct their settings in " + paths::kSystemSettings);
    }
    return kDone;
}

}  // namespace

void AddNotify(CLI::App& app, int& status) {
    CLI::App& notify = *app.add_subcommand("notify", "Delivery of notices");
    notify.require_subcommand(1);
    AddCommand<OutputOptions>(notify, "test", "Send a test notice on every channel", status, setup, run);
}

}  // namespace quor::cli

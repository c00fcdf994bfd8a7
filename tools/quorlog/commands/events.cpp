// events list, html, clear: the package's own event log.

#include <algorithm>
#include <filesystem>

#include "base/paths.h"
#include "logger.h"
#include "store/ask.h"
#include "store/databasefile.h"
#include "store/dates.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/deeds.h"
#include "tools/quorlog/eventpage.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

struct EventsOptions {
    std::string db = paths::kEventDb;
    OutputOptions output;
    uint64_t limit = 0;
    uint64_t offset = 0;
    std::string page;
    bool safe = false;
    bool yes = false;
};

void setupList(CLI::App& command, EventsOptions& options) {
    AddDatabaseOption(command, options.db);
    AddOutputOptions(command, options.output);
    AddNumberOption(command, "-n,--limit", options.limit, "Number of events, 0 for all");
    AddNumberOption(command, "--offset", options.offset, "Number of events to skip");
}

void setupHtml(CLI::App& command, EventsOptions& options) {
    command.add_option("file", options.page, "The page to write")->type_name("FILE")->required();
    AddDatabaseOption(command, options.db);
    command.add_flag("--safe", options.safe, "Escape texts, so that an event cannot bring its own markup");
}

void setupClear(CLI::App& command, EventsOptions& options) {
    AddDatabaseOption(command, options.db);
    AddYesOption(command, options.yes);
}

// The library would create a missing database.
std::string requireEvents(const std::string& path) {
    std::string db = store::RequireDatabase(path, "start quorlogd, which writes it, or give another --db");
    store::RequireTable(db, "log");
    return db;
}

int clamped(uint64_t number) {
    return static_cast<int>(std::min<uint64_t>(number, INT32_MAX));
}

int runList(const EventsOptions& options) {
    const std::string db = requireEvents(options.db);
    const bool paged = options.limit != 0 || options.offset != 0;  // without a limit the library ignores the offset
    const uint64_t limit = paged && options.limit == 0 ? INT32_MAX : options.limit;
    const auto events = Logger().LogEnum(db, clamped(options.offset), clamped(limit));
    const Style style = options.output.style();
    const bool table = style.format == Format::Table;
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(
        style, {{"id", Kind::Number}, {"time", table ? Kind::Text : Kind::Number}, {"level"}, {"user"}, {"event"}},
        out);
    for (const _SSYSLOG_LOG_LOG_tag& event : events) {
        const std::string id = std::to_string(event.id);
        const std::string time = table ? store::LocalTime(event.time) : std::to_string(event.time);
        sink->row({id, time, strLevelGet(event.level), event.user, event.event});
    }
    sink->finish();
    return events.empty() ? ReportNothing("no events were recorded") : kDone;
}

int runHtml(const EventsOptions& options) {
    const std::string db = requireEvents(options.db);
    const std::string page = store::AbsolutePath(options.page);
    if (Logger().LogCount(db) == 0) {
        return ReportNothing("no events were recorded");
    }
    if (options.safe) {
        WriteEventPage(Logger().LogEnum(db, 0, 0), page);
    } else {
        RequireWritable(page);  // the library does not say when it cannot write
        Logger().LogHtmlGen(db, "events", page);
    }
    WriteLine("wrote " + page);
    return kDone;
}

int runClear(const EventsOptions& options) {
    const std::string db = requireEvents(options.db);
    const std::string user = UserName();
    if ((db + user).find('\'') != std::string::npos) {
        throw Failure("a path or user name with an apostrophe cannot be recorded; rename " + db);
    }
    if (!options.yes && !Confirm("Delete every event of " + db + "?")) {
        Complain("nothing cleared");
        return kNothing;
    }
    const int before = Logger().LogCount(db);
    Logger().LogClear(db, user);
    if (std::filesystem::exists(db) && Logger().LogCount(db) > 1 && Logger().LogCount(db) >= before) {
        throw Failure("cannot clear " + db + "; make sure that you may write its folder", store::Cause::Denied);
    }
    WriteLine("cleared " + db);
    return kDone;
}

}  // namespace

void AddEvents(CLI::App& app, int& status) {
    CLI::App& events = *app.add_subcommand("events", "The package's own event log");
    events.require_subcommand(1);
    AddCommand<EventsOptions>(events, "list", "Print events, newest first", status, setupList, runList);
    AddCommand<EventsOptions>(events, "html", "Write all events as an HTML page", status, setupHtml, runHtml);
    AddCommand<EventsOptions>(events, "clear", "Delete every event", status, setupClear, runClear);
}

}  // namespace quor::cli

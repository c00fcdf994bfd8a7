#include <sys/stat.h>
#include <syslog.h>

#include <CLI/CLI.hpp>
#include <cstdio>
#include <filesystem>

#include "base/paths.h"
#include "tools/quorlogd/daemon.h"
#include "tools/quorlogd/housekeeping.h"
#include "tools/quorlogd/pidfile.h"

namespace {

void setUp(CLI::App& app, quor::Options& options) {
    app.set_version_flag("--version", "quorlogd " QUORLOGD_VERSION);
    app.add_option("--db", options.db, "Log database to follow")->capture_default_str();
    app.add_option("--flush-interval", options.flushSeconds, "Seconds between two writes of the accounting database")
        ->check(CLI::Range(1, 3600))
        ->capture_default_str();
    app.add_option("--check-interval", options.checkSeconds, "Seconds between two checks of space, losses and notices")
        ->check(CLI::Range(1, 86400))
        ->capture_default_str();
    app.add_option("--volume", options.volume, "Folder on the volume that holds the logs")->capture_default_str();
    app.add_option("--volume-full", options.volumeFullPercent,
                   "Percentage of use from which the volume counts as full; 0: not checked")
        ->check(CLI::Range(0.0, 100.0))
        ->capture_default_str();
    app.add_option("--working-db-max", options.workingDbMaxKb,
                   "KiB above which the working database is removed and begun anew; 0: not checked")
        ->check(CLI::NonNegativeNumber)
        ->capture_default_str();
    app.add_option("--control", options.control,
                   "Control socket of syslog-ng, which is asked for losses; empty: it is not")
        ->capture_default_str();
    app.add_option("--udp-port", options.udpPort,
                   "UDP port whose losses are watched; left out: that of syslog-ng's configuration")
        ->check(CLI::Range(1, 65535));
    app.add_option("--max-notices", options.noticesPerMinute, "Notices a minute; more matching logs are only counted")
        ->check(CLI::Range(0, 100000))
        ->capture_default_str();
    app.add_option("--max-devices", options.maxDevices, "Devices counted apart; the logs of others count together")
        ->check(CLI::Range(1, 10000000))
        ->capture_default_str();
    app.add_option("--max-waiting", options.maxWaiting,
                   "Counts of devices read ahead while the accounting database cannot be written")
        ->check(CLI::Range(1, 100000000))
        ->capture_default_str();
    app.add_flag("--stderr", options.toStandardError, "Write messages to standard error too");
}

int run(int argc, char** argv) {
    quor::Options options;
    options.volume = std::filesystem::path(options.db).parent_path();
    CLI::App app(
        "Follows the log database that syslog-ng writes: accounts every row, checks the notification rules and records "
        "events. Signals: TERM or INT ends, HUP reads the rules anew, USR1 reports statistics, USR2 writes the "
        "accounting database.",
        "quorlogd");
    setUp(app, options);
    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError& error) {
        return app.exit(error) == 0 ? 0 : 2;
    }
    openlog("quorlogd", LOG_PID | (options.toStandardError ? LOG_PERROR : 0), LOG_DAEMON);
    quor::Descriptor signals = quor::OpenSignals();
    (void)umask(027);  // what is written holds log content
    const quor::PidFile only(quor::paths::kReceiverPid);
    quor::PrepareDatabases();
    return quor::Daemon(options, std::move(signals)).run();
}

}  // namespace

int main(int argc, char** argv) {
    try {
        return run(argc, argv);
    } catch (const std::exception& error) {
        syslog(LOG_ERR, "Stopped: %s", error.what());
        (void)fprintf(stderr, "quorlogd: %s\n", error.what());
        return 1;
    }
}

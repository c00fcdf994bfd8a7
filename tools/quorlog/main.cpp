// quorlog: the command line over the log library.
#include <fcntl.h>
#include <unistd.h>

#include <CLI/CLI.hpp>
#include <cstdio>
#include <iostream>

#include "store/failure.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/output.h"
#include "tools/quorlog/usage.h"

namespace {

using quor::cli::kFailed;

int fail(const std::string& text) {
    quor::cli::Complain(text);
    return kFailed;
}

// Help is an error to the parser, too.
int parseFailed(const CLI::App& app, const CLI::ParseError& error) {
    if (error.get_exit_code() == 0) {
        app.exit(error);
        return std::cout.flush() ? quor::cli::kDone : fail("cannot write the help; make sure that its disk has room");
    }
    return fail(quor::cli::Explain(app, error));
}

int run(int argc, char** argv) {
    CLI::App app;
    app.name("quorlog");
    app.set_version_flag("--version", "quorlog " QUORLOG_VERSION);
    int status = quor::cli::kDone;
    try {
        quor::cli::AddCommands(app, status, argc > 1 ? argv[1] : "");
        app.parse(argc, argv);
        return status;
    } catch (const CLI::ParseError& error) {
        return parseFailed(app, error);
    } catch (const quor::cli::ReaderLeft&) {
        return quor::cli::kDone;
    } catch (const quor::store::Failure& failure) {
        return fail(failure.what());
    }
}

}  // namespace

int main(int argc, char** argv) {
    if (fcntl(STDOUT_FILENO, F_GETFD) < 0) {
        (void)fputs("quorlog: standard output is closed; open it, or send it to /dev/null\n", stderr);
        return kFailed;
    }
    try {
        return run(argc, argv);
    } catch (...) {
        (void)fputs("quorlog: out of memory; ask for fewer rows with --limit\n", stderr);  // nothing else ends here
        return kFailed;
    }
}

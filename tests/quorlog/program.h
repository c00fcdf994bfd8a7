// Runs the program in a folder of its own.
#ifndef TESTS_QUORLOG_PROGRAM_H
#define TESTS_QUORLOG_PROGRAM_H

#include <sys/wait.h>

#include <algorithm>

#include "tests/support/testing.h"

namespace quor::test {

struct Outcome {
    int status;
    std::string out;
    std::string err;
};

class Program : public testing::Test {
  protected:
    struct Case {
        const char* arguments;
        int status;
        const char* out;
        const char* err = "";  // a part of it
    };

    // `arguments` as a shell reads them.
    Outcome run(const std::string& arguments, const std::string& input = "") const {
        folder_.write("in", input);
        const int status =
            system(("cd " + folder_.path() + " && { exec " QUORLOG " " + arguments + "; } <in >out 2>err").c_str());
        return {WEXITSTATUS(status), ReadFile(folder_.path("out")), ReadFile(folder_.path("err"))};
    }

    // `options` end the arguments of each case that does not name a database.
    void expect(std::initializer_list<Case> cases, const std::string& options = "") const {
        for (const Case& test : cases) {
            const std::string arguments = test.arguments;
            const Outcome outcome = run(arguments + (arguments.find("--db") == std::string::npos ? options : ""));
            EXPECT_EQ(outcome.status, test.status) << arguments << outcome.err;
            EXPECT_EQ(outcome.out, test.out) << arguments;
            const size_t message = test.status == 2 ? outcome.err.find("quorlog: ") : 0;
            EXPECT_NE(outcome.err.find(test.err, message), std::string::npos) << arguments << outcome.err;
        }
    }

    SqliteFile database(const std::string& name) const { return SqliteFile(folder_.path(name)); }
    bool exists(const std::string& name) const { return std::filesystem::exists(folder_.path(name)); }

    const TempFolder folder_;
};

}  // namespace quor::test

#endif

// The program as a person meets it: sessions/*.txt hold commands and everything that they print. A line "$ ..." is run
// by a shell, in one fresh folder for each file; lines of standard error stand behind "! ", a failed command's status
// in brackets. With QUOR_REWRITE_SESSIONS set the files are written anew, for review.
#include <sys/wait.h>

#include <sstream>

#include "tests/support/testing.h"

using namespace quor::test;

namespace {

std::string replaced(std::string text, const std::string& what, const std::string& by) {
    for (size_t at = 0; !what.empty() && (at = text.find(what, at)) != std::string::npos; at += by.size()) {
        text.replace(at, what.size(), by);
    }
    return text;
}

class Session : public testing::TestWithParam<std::string> {
  protected:
    std::string outcome(const std::string& command) const {
        const std::string script = aside_.write(
            "script", "quorlog() { $QUORLOG \"$@\"; }; quorlogd() { $QUORLOGD \"$@\"; }\n" + command + "\n");
        const std::string streams = " >" + aside_.path("out") + " 2>" + aside_.path("err") + " </dev/null";
        const int status = system(("cd " + folder_.path() + " && sh " + script + streams).c_str());
        std::string text = ReadFile(aside_.path("out"));
        std::istringstream errors(ReadFile(aside_.path("err")));
        for (std::string line; std::getline(errors, line);) {
            text.append("! ").append(line).append("\n");
        }
        text += status != 0 ? "[" + std::to_string(WEXITSTATUS(status)) + "]\n" : "";
        return replaced(replaced(text, folder_.path(), "FOLDER"), QUOR_ROOT, "ROOT");
    }

    const TempFolder folder_;
    const TempFolder aside_;
};

TEST_P(Session, PrintsWhatIsWritten) {
    setenv("TZ", "UTC", 1);
    setenv("PAGER", "cat", 1);
    for (const char* variable : {"QUORLOG_PAGER", "COLUMNS", "LINES"}) {
        unsetenv(variable);
    }
    setenv("QUORLOG", QUORLOG, 1);
    setenv("QUORLOGD", QUORLOGD, 1);
    setenv("ROOT", QUOR_ROOT, 1);
    setenv("SOURCE", SOURCE_FOLDER, 1);
    const std::string path = SOURCE_FOLDER "/tests/quorlog/sessions/" + GetParam() + ".txt";
    std::istringstream lines(ReadFile(path));
    std::string actual;
    for (std::string line; std::getline(lines, line);) {
        if (line.rfind("# ", 0) == 0) {
            actual += line + '\n';
        } else if (line.rfind("$ ", 0) == 0) {
            actual += line + '\n' + outcome(line.substr(2)) + '\n';
        }
    }
    EXPECT_EQ(actual, lines.str());
    if (getenv("QUOR_REWRITE_SESSIONS") != nullptr) {
        WriteFile(path, actual);
    }
}

INSTANTIATE_TEST_SUITE_P(Quorlog, Session,
                         testing::Values("archives", "columns", "completion", "context", "daemon", "databases",
                                         "events", "failures", "forms", "help", "pager", "parse", "recovery", "rules",
                                         "search", "statistics", "terminal", "usage"),
                         [](const auto& test) { return test.param; });

}  // namespace

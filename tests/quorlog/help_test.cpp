// The manual and the completion name every command and every option that the program has, and no other.
#include <gtest/gtest.h>

#include <CLI/CLI.hpp>
#include <set>
#include <sstream>

#include "tests/support/temp_folder.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/examples.h"

namespace {

using quor::test::ReadFile;

std::set<std::string> wordsOf(const std::string& text) {
    std::istringstream stream(text);
    return {std::istream_iterator<std::string>(stream), {}};
}

// A command like "db info", and those below it.
void expectDescribed(const CLI::App& app, const std::string& command) {
    static const std::string script = ReadFile(SOURCE_FOLDER "/etc/bash-completion/quorlog");
    static const std::string manual = ReadFile(SOURCE_FOLDER "/docs/man/quorlog.1");
    std::set<std::string> words;
    for (const CLI::Option* option : app.get_options()) {
        for (const std::string& name : option->get_lnames()) {
            words.insert("--" + name);
            EXPECT_NE(manual.find(".It Fl -" + name), std::string::npos) << name;
        }
    }
    for (const CLI::App* sub : app.get_subcommands([](const CLI::App*) { return true; })) {
        const std::string path = (command.empty() ? "" : command + " ") + sub->get_name();
        words.insert(sub->get_name());
        EXPECT_NE(manual.find(" Cm " + path + "\n"), std::string::npos) << path;
        expectDescribed(*sub, path);
    }
    for (const std::string& word :
         wordsOf(quor::cli::ExampleOfCommand("quorlog" + (command.empty() ? "" : " " + command)))) {
        EXPECT_TRUE(word.rfind("--", 0) != 0 || words.count(word) != 0 || command.empty()) << command << word;
    }
    const std::string start = "\n    '" + command + "') words='";
    const size_t begin = script.find(start) + start.size();
    EXPECT_EQ(wordsOf(script.substr(begin, script.find('\'', begin) - begin)), words) << command;
}

TEST(Help, CompletionAndManualHaveWhatTheProgramHas) {
    CLI::App app;
    int status = 0;
    quor::cli::AddCommands(app, status);
    expectDescribed(app, "");
}

}  // namespace

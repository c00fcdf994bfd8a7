// The manual and the completion name every command and every option that the program has, and no other.
#include <gtest/gtest.h>

#include <CLI/CLI.hpp>
#include <map>
#include <set>
#include <sstream>

#include "commands.h"
#include "support/temp_folder.h"

namespace {

using quor::test::ReadFile;

// "search" or "db info", with the words that may follow it.
using Commands = std::map<std::string, std::set<std::string>>;

void collect(const CLI::App& app, const std::string& path, Commands& commands) {
    std::set<std::string>& words = commands[path];
    for (const CLI::App* sub : app.get_subcommands([](const CLI::App*) { return true; })) {
        words.insert(sub->get_name());
        collect(*sub, path.empty() ? sub->get_name() : path + " " + sub->get_name(), commands);
    }
    for (const CLI::Option* option : app.get_options()) {
        for (const std::string& name : option->get_lnames()) {
            words.insert("--" + name);
        }
    }
}

std::set<std::string> wordsOf(const std::string& text) {
    std::istringstream stream(text);
    return {std::istream_iterator<std::string>(stream), {}};
}

TEST(Help, CompletionAndManualHaveWhatTheProgramHas) {
    const std::string script = ReadFile(SOURCE_FOLDER "/etc/bash-completion/quorlog");
    const std::string manual = ReadFile(SOURCE_FOLDER "/docs/man/quorlog.1");
    CLI::App app;
    int status = 0;
    quor::cli::AddCommands(app, status);
    Commands commands;
    collect(app, "", commands);
    for (const auto& [command, words] : commands) {
        const std::string start = "\n    '" + command + "') words='";
        const size_t at = script.find(start);
        ASSERT_NE(at, std::string::npos) << command;
        const size_t begin = at + start.size();
        EXPECT_EQ(wordsOf(script.substr(begin, script.find('\'', begin) - begin)), words) << command;
        EXPECT_TRUE(command.empty() || manual.find(" Cm " + command + "\n") != std::string::npos) << command;
        for (const std::string& word : words) {
            const bool option = word.front() == '-';
            EXPECT_TRUE(!option || manual.find(".It Fl -" + word.substr(2)) != std::string::npos) << word;
        }
    }
}

}  // namespace

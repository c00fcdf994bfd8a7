#include "tools/quorlog/usage.h"

#include <algorithm>

#include "tools/quorlog/examples.h"
#include "tools/quorlog/wrap.h"

namespace quor::cli {
namespace {

constexpr size_t kWidth = 78;  // help on every command is indented by two
constexpr size_t kNames = 26;

std::vector<const CLI::App*> commandsOf(const CLI::App& app) {
    return app.get_subcommands([](const CLI::App*) { return true; });
}

// A name and what it stands for.
std::string entry(const std::string& name, const std::string& description) {
    std::string out = "  " + name;
    if (out.size() + 2 > kNames) {
        out += '\n';
    }
    out.append(out.back() == '\n' ? kNames : kNames - out.size(), ' ');
    AppendWrapped(out, description, kWidth - kNames, kNames);
    return out + '\n';
}

class Help : public CLI::Formatter {
  public:
    // Of every command: the parser's own stops at groups such as stats.
    std::string make_expanded(const CLI::App* command) const override {
        std::string help = CLI::Formatter::make_expanded(command);
        for (const CLI::App* sub : commandsOf(*command)) {
            help += "\n" + command->get_name() + " " + make_expanded(sub);
        }
        return help;
    }

    std::string make_usage(const CLI::App* app, std::string name) const override {
        const std::string options = app->get_parent() == nullptr ? "" : " [OPTIONS]";
        std::string usage = "\nUsage: " + name + (commandsOf(*app).empty() ? options : " COMMAND [OPTIONS]");
        for (const CLI::Option* option :
             app->get_options([](const CLI::Option* each) { return each->get_positional(); })) {
            usage += " <" + option->get_name(true) + ">";
        }
        return usage + "\n" + exampleOf(name);
    }

    std::string make_option(const CLI::Option* option, bool positional) const override {
        std::string name = positional ? "<" + option->get_name(true) + ">" : option->get_name(false, true);
        const size_t comma = name.find(',');
        name.insert(comma == std::string::npos ? name.size() : comma + 1, comma == std::string::npos ? "" : " ");
        if (!positional && option->get_type_size() != 0) {
            const std::string type = option->get_type_name();
            name += " " + type.substr(0, type.find(':'));
        }
        return entry(name, option->get_description()) + usual(option->get_default_str());
    }

    std::string make_subcommand(const CLI::App* sub) const override {
        return entry(sub->get_name(), sub->get_description());
    }

  private:
    // Paths are for copying: they stay in one piece.
    static std::string usual(const std::string& value) {
        return value.empty() ? "" : std::string(kNames, ' ') + "Default: " + value + "\n";
    }

    static std::string exampleOf(const std::string& command) {
        const std::string example = ExampleOfCommand(command);
        return example.empty() ? "" : "For example: " + example + "\n";
    }
};

// The command that was being read, and how it is typed.
struct Place {
    const CLI::App* app;
    std::string path;
};

Place placeOf(const CLI::App& root) {
    Place place{&root, root.get_name()};
    for (std::vector<CLI::App*> chosen = root.get_subcommands(); !chosen.empty();
         chosen = place.app->get_subcommands()) {
        place = {chosen.front(), place.path + " " + chosen.front()->get_name()};
    }
    return place;
}

// Without the name of the program, which stands in front of every message.
std::string nameOf(const Place& place) {
    return place.path.substr(place.path.find(' ') + 1);
}

std::string namesOf(const CLI::App& app) {
    std::string names;
    for (const CLI::App* command : commandsOf(app)) {
        names += (names.empty() ? "" : ", ") + command->get_name();
    }
    return names;
}

// The last part of a message. An option that has no example has its command's help.
std::string example(const Place& place, const std::string& option) {
    const std::string line = option.empty() ? ExampleOfCommand(place.path) : ExampleOfOption(nameOf(place), option);
    return line.empty() ? "; see " + place.path + " --help" : "; for example: " + line;
}

std::string withCommas(std::string list) {
    for (size_t at = 0; (at = list.find(',', at)) != std::string::npos; at += 2) {
        list.replace(at, 1, ", ");
    }
    return list;
}

std::string explainCommand(const Place& place) {
    const std::vector<std::string> extras = place.app->remaining();
    const std::string problem = extras.empty() ? "a command is missing" : "no such command '" + extras.front() + "'";
    return (place.app->get_parent() == nullptr ? "" : nameOf(place) + ": ") + problem + "; give one of " +
           namesOf(*place.app);
}

std::string explainExtra(const Place& place) {
    const std::vector<std::string> extras = place.app->remaining();
    const auto option = std::find_if(extras.begin(), extras.end(), [](const auto& word) { return word[0] == '-'; });
    if (option != extras.end()) {
        return nameOf(place) + " has no option " + *option + "; see " + place.path + " --help";
    }
    const std::string word = extras.empty() ? "" : extras.front();
    const bool searches = place.app->get_option_no_throw("--keyword") != nullptr;
    return nameOf(place) + ": '" + word + "' belongs to no option" +
           (searches ? "; a text to look for is given as --keyword '" + word + "'" : example(place, ""));
}

// "--by: colour not in {host,program}"
std::string explainValue(const Place& place, const std::string& option, const std::string& problem) {
    const size_t list = problem.rfind(" not in {");
    if (list == std::string::npos) {
        return option + ": " + problem + example(place, option);
    }
    const size_t names = list + std::string_view(" not in {").size();
    return option + ": no such name '" + problem.substr(0, list) + "'; give one of " +
           withCommas(problem.substr(names, problem.rfind('}') - names));
}

std::string explainNumber(const Place& place, const std::string& option, const std::string& problem) {
    const bool missing = problem.find("missing") != std::string::npos || problem.find("east") != std::string::npos;
    return option + (missing ? " needs a value" : " can be given once only") + example(place, option);
}

// "one VERB other"
std::string explainPair(const Place& place, const std::string& text, const std::string& verb) {
    const size_t at = text.find(verb);
    const std::string one = text.substr(0, at);
    const std::string other = text.substr(at + verb.size());
    return verb == " excludes " ? one + " does not go with " + other + "; leave one of them out"
                                : one + " goes with " + other + " only; add it, or see " + place.path + " --help";
}

}  // namespace

std::shared_ptr<CLI::Formatter> MakeHelp() {
    auto help = std::make_shared<Help>();
    help->label("Positionals", "Arguments");
    return help;
}

std::string Explain(const CLI::App& app, const CLI::ParseError& error) {
    const Place place = placeOf(app);
    const std::string text = error.what();
    const std::string kind = error.get_name();
    const size_t colon = text.find(": ");
    const std::string option = text.substr(0, colon);
    const std::string problem = colon == std::string::npos ? "" : text.substr(colon + 2);
    if (!commandsOf(*place.app).empty()) {
        return explainCommand(place);
    }
    if (dynamic_cast<const CLI::ExtrasError*>(&error) != nullptr) {  // its name is that of the command
        return explainExtra(place);
    }
    if (kind == "RequiredError") {
        return nameOf(place) + " needs <" + text.substr(0, text.find(' ')) + ">" + example(place, "");
    }
    if (kind == "ConversionError") {
        return problem.substr(0, problem.find(' ')) + " takes no value; give it by itself, or leave it out";
    }
    if (kind == "ValidationError") {
        return explainValue(place, option, problem);
    }
    if (kind == "ArgumentMismatch") {
        return explainNumber(place, option, problem);
    }
    if (kind == "ExcludesError" || kind == "RequiresError") {
        return explainPair(place, text, kind == "ExcludesError" ? " excludes " : " requires ");
    }
    return text + "; see " + place.path + " --help";
}

}  // namespace quor::cli

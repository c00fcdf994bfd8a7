#include "tools/quorlog/options.h"

#include <sys/ioctl.h>

#include <algorithm>
#include <charconv>
#include <cstdlib>

#include "base/numbers.h"
#include "base/paths.h"
#include "store/columns.h"

namespace quor::cli {
namespace {

// A terminal that can do more than print.
bool isCapable() {
    const char* terminal = getenv("TERM");
    return terminal != nullptr && std::string(terminal) != "dumb";
}

bool wantsColor() {
    const char* noColor = getenv("NO_COLOR");
    return (noColor == nullptr || *noColor == '\0') && isCapable();
}

// A size of the terminal: as the environment says, as the terminal says, or as most are.
size_t sizeOf(const char* variable, unsigned short winsize::*told, size_t usual) {
    constexpr uint64_t kMost = 10000;
    const char* const text = getenv(variable);
    const uint64_t set = text == nullptr ? 0 : ToUint64(text);
    if (set != 0) {
        return static_cast<size_t>(std::min(set, kMost));
    }
    winsize size{};
    return ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.*told != 0 ? size.*told : usual;
}

CLI::IsMember namesOf(const std::array<const char*, 4>& names) {
    return CLI::IsMember(std::vector<std::string>(names.begin(), names.end()));
}

void addList(CLI::App& command, const std::string& name, store::Names& value, const std::string& help) {
    AddListOption(command, name, value, help)->group("Filters");
}

CLI::Option* addFilter(CLI::App& command, const std::string& name, std::string& value, const std::string& type,
                       const std::string& help) {
    return RefuseEmpty(command.add_option(name, value, help)->type_name(type)->group("Filters"));
}

}  // namespace

CLI::Option* RefuseEmpty(CLI::Option* option) {
    return option->each([option](const std::string& value) {
        if (value.empty()) {
            throw Failure(option->get_name() + ": the value is empty; leave the option out, or give one");
        }
    });
}

Style OutputOptions::style() const {
    Style style;
    const auto* const known = std::find(kFormatNames.begin(), kFormatNames.end(), format);
    style.format = static_cast<Format>(known - kFormatNames.begin());
    style.safeCsv = safeCsv;
    style.terminal = isatty(STDOUT_FILENO) == 1;
    style.color = style.terminal && wantsColor();
    if (style.terminal) {
        style.width = sizeOf("COLUMNS", &winsize::ws_col, 80);
        style.height = sizeOf("LINES", &winsize::ws_row, 24);
        style.pager = noPager || !isCapable() ? std::vector<std::string>() : FindPager();
    }
    return style;
}

void AddDatabaseOption(CLI::App& command, std::string& db) {
    command.add_option("--db", db, "Database file")->type_name("PATH")->capture_default_str();
}

void AddTableOption(CLI::App& command, std::string& table) {
    command.add_option("--table", table, "Table to read")
        ->type_name("NAME")
        ->capture_default_str()
        ->check(namesOf(store::kLogTables));
}

void AddFilterOptions(CLI::App& command, store::FilterOptions& filters, bool lenient) {
    filters.lenient = lenient;
    const std::string like = lenient ? "; * and ? stand for any text" : "";
    addList(command, "--host", filters.host, "Sending hosts" + like);
    addList(command, "--level", filters.level, "Levels, such as err,crit; err+ is err and worse");
    addList(command, "--facility", filters.facility, "Facilities, such as kern,auth");
    addList(command, "--program", filters.program, "Programs" + like);
    addList(command, "--pid", filters.pid, "Process ids");
    addList(command, "--ip", filters.ip, "Addresses of senders" + like);
    addList(command, "--msgid", filters.msgid, "Message ids (RFC 5424)");
    addFilter(command, "--sdata", filters.sdata, "TEXT", "Structured data that contains the text (RFC 5424)");
    CLI::Option* keyword = addFilter(command, "--keyword", filters.keyword, "TEXT", "Messages that contain the text");
    addFilter(command, "--glob", filters.glob, "PATTERN",
              "Messages like this as a whole; * is any text, ? any character")
        ->excludes(keyword);
    if (lenient) {
        addFilter(command, "--regex", filters.regex, "PATTERN", "Messages that hold a match of the regular expression");
    }
    command
        .add_flag("-i,--ignore-case", filters.ignoreCase,
                  lenient ? "Keywords and expressions in small or capital letters"
                          : "Keywords in small or capital letters (ASCII)")
        ->group("Filters");
    addFilter(command, "--from,--since", filters.from, "TIME",
              "First day or second: 6h, today, yesterday, 7d, 10:00, YYYY-MM-DD, 'YYYY-MM-DD hh:mm'");
    addFilter(command, "--to,--until", filters.to, "TIME", "Last day or second, inclusive");
    addFilter(command, "--last", filters.last, "SPAN", "Since so long ago: 90s, 10m, 6h, 2d, 1w");
    addList(command, "--not-host", filters.notHost, "Any host but these");
    addList(command, "--not-level", filters.notLevel, "Any level but these");
    addList(command, "--not-facility", filters.notFacility, "Any facility but these");
    addList(command, "--not-program", filters.notProgram, "Any program but these");
    addFilter(command, "--not-keyword", filters.notKeyword, "TEXT", "Messages without the text");
    if (lenient) {
        addFilter(command, "--not-regex", filters.notRegex, "PATTERN", "Messages without a match of it");
    }
}

void AddOutputOptions(CLI::App& command, OutputOptions& output) {
    command.add_option("--format", output.format, "Output format: table, json, csv, ndjson")
        ->type_name("NAME")
        ->capture_default_str()
        ->check(namesOf(kFormatNames));
    command.add_flag("--safe-csv", output.safeCsv,
                     "csv: put ' before cells that a spreadsheet would take for a formula");
    command.add_flag("--no-pager", output.noPager, "Do not show long output through a pager");
}

// The parser's own lists would take some texts apart.
CLI::Option* AddListOption(CLI::App& command, const std::string& name, store::Names& value, const std::string& help) {
    const auto take = [&value](const std::vector<std::string>& given) {
        value = given;
        return true;
    };
    return RefuseEmpty(command.add_option(name, take, help)->type_name("NAMES")->take_all());
}

void AddYesOption(CLI::App& command, bool& yes) {
    command.add_flag("--yes", yes, "Do not ask for confirmation");
}

CLI::Option* AddNumberOption(CLI::App& command, const std::string& name, uint64_t& value, const std::string& help) {
    const std::string longName = name.substr(name.find_last_of(',') + 1);
    const auto parse = [&value, longName](const std::vector<std::string>& given) {
        const std::string& text = given.back();
        const auto result = std::from_chars(text.data(), text.data() + text.size(), value);
        if (result.ec != std::errc() || result.ptr != text.data() + text.size()) {
            throw Failure(longName + ": not a number: '" + text + "'; give digits only");
        }
        return true;
    };
    return command.add_option(name, parse, help)->type_name("NUMBER");
}

}  // namespace quor::cli

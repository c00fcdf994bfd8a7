#include "store/columns.h"

#include <algorithm>
#include <charconv>
#include <iterator>

#include "base/words.h"
#include "store/failure.h"

namespace quor::store {
namespace {

template <auto Member>
std::string_view text(const Record& record, std::string&) {
    return record.*Member;
}

template <auto Member>
std::string_view number(const Record& record, std::string& scratch) {
    scratch.resize(24);
    const auto end = std::to_chars(scratch.data(), scratch.data() + scratch.size(), record.*Member);
    return {scratch.data(), static_cast<size_t>(end.ptr - scratch.data())};
}

std::string_view level(const Record& record, std::string&) {
    const auto index = static_cast<size_t>(record.prio);
    return index < std::size(g_MappingSyslogPrior) ? g_MappingSyslogPrior[index] : "";
}

// Empty for a row of a database that does not know.
std::string_view received(const Record& record, std::string& scratch) {
    return record.rsec == 0 ? std::string_view() : number<&Record::rsec>(record, scratch);
}

std::string_view process(const Record& record, std::string& scratch) {
    return record.pid.empty() ? record.prog : scratch.assign(record.prog).append("[").append(record.pid).append("]");
}

constexpr Column kLogs[] = {
    {"id", "id", Kind::Number, Shown::Always, number<&Record::id>},
    {"ldate", "date", Kind::Text, Shown::Always, text<&Record::ldate>},
    {"ltime", "time", Kind::Text, Shown::Always, text<&Record::ltime>},
    {"utcsec", "sent", Kind::Number, Shown::InFull, number<&Record::utcsec>},
    {"tzoffset", "zone", Kind::Text, Shown::InFull, text<&Record::tzoffset>},
    {"host", "host", Kind::Text, Shown::Always, text<&Record::host>},
    {"ip", "ip", Kind::Text, Shown::InFull, text<&Record::ip>},
    {"fac", "facility", Kind::Text, Shown::Always, text<&Record::fac>},
    {"prio", "level", Kind::Level, Shown::Always, level},
    {"tag", "tag", Kind::Text, Shown::InFull, text<&Record::tag>},
    {"prog", "program", Kind::Text, Shown::InFull, text<&Record::prog>},
    {"prog", "program", Kind::Text, Shown::InBrief, process},
    {"msg", "message", Kind::Text, Shown::Always, text<&Record::msg>},
    {"pid", "pid", Kind::Text, Shown::InFull, text<&Record::pid>},
    {"msgid", "msgid", Kind::Text, Shown::InFull, text<&Record::msgid>},
    {"sdata", "sdata", Kind::Text, Shown::InFull, text<&Record::sdata>},
    {"rsec", "received", Kind::Number, Shown::InFull, received},
};

constexpr Column kSystemLogs[] = {
    {"id", "id", Kind::Number, Shown::Always, number<&Record::id>},
    {"ldate", "date", Kind::Text, Shown::Always, text<&Record::ldate>},
    {"ltime", "time", Kind::Text, Shown::Always, text<&Record::ltime>},
    {"host", "host", Kind::Text, Shown::Always, text<&Record::host>},
    {"llevel", "level", Kind::Level, Shown::Always, level},
    {"prog", "program", Kind::Text, Shown::Always, text<&Record::prog>},
    {"luser", "user", Kind::Text, Shown::Always, text<&Record::luser>},
    {"msg", "message", Kind::Text, Shown::Always, text<&Record::event>},
};

constexpr Column kTransfers[] = {
    {"id", "id", Kind::Number, Shown::Always, number<&Record::id>},
    {"ldate", "date", Kind::Text, Shown::Always, text<&Record::ldate>},
    {"ltime", "time", Kind::Text, Shown::Always, text<&Record::ltime>},
    {"host", "host", Kind::Text, Shown::Always, text<&Record::host>},
    {"ip", "ip", Kind::Text, Shown::Always, text<&Record::xferip>},
    {"prog", "program", Kind::Text, Shown::Always, text<&Record::prog>},
    {"luser", "user", Kind::Text, Shown::Always, text<&Record::luser>},
    {"event", "event", Kind::Text, Shown::Always, text<&Record::event>},
    {"isdir", "folder", Kind::Number, Shown::InFull, number<&Record::isdir>},
    {"fsize", "size", Kind::Text, Shown::Always, text<&Record::fsize>},
    {"fname", "file", Kind::Text, Shown::Always, text<&Record::fname>},
};

std::string titlesOf(const std::vector<Column>& columns) {
    std::string titles;
    for (const Column& column : columns) {
        titles.append(titles.empty() ? "" : ", ").append(column.title);
    }
    return titles;
}

Column columnNamed(const std::vector<Column>& all, std::string_view name, const std::string& table) {
    for (Column column : all) {
        for (const char* known : {column.name, column.title}) {
            if (name == known) {
                column.name = column.title = known;
                return column;
            }
        }
    }
    throw Failure("--columns: table " + table + " has no column '" + std::string(name) + "'; give " + titlesOf(all));
}

}  // namespace

std::vector<Column> ColumnsOf(const std::string& table, bool brief) {
    std::vector<Column> columns;
    const auto add = [&](const auto& all) {
        std::copy_if(std::begin(all), std::end(all), std::back_inserter(columns), [&](const Column& column) {
            return column.shown == Shown::Always || (column.shown == Shown::InBrief) == brief;
        });
    };
    if (table == "logs") {
        add(kLogs);
    } else if (table == "transfer_log") {
        add(kTransfers);
    } else {
        add(kSystemLogs);
    }
    return columns;
}

std::vector<Column> ColumnsNamed(const std::string& table, const std::string& list) {
    const std::vector<Column> all = ColumnsOf(table, false);
    std::vector<Column> columns;
    EachWord(list, ", ", [&](std::string_view name) {
        const Column named = columnNamed(all, name, table);
        for (const Column& column : columns) {
            if (column.read == named.read) {
                throw Failure("--columns: '" + std::string(name) + "' is named twice; leave one out");
            }
        }
        columns.push_back(named);
    });
    if (columns.empty()) {
        throw Failure("--columns: no column in '" + list + "'; give " + titlesOf(all));
    }
    return columns;
}

bool HasColumn(const std::string& table, std::string_view name) {
    if (table == "logs" && name == "llevel") {
        return true;  // a second name of prio, there for the search
    }
    const std::vector<Column> columns = ColumnsOf(table, false);
    return std::any_of(columns.begin(), columns.end(), [name](const Column& column) { return column.name == name; });
}

}  // namespace quor::store

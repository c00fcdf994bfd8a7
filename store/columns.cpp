#include "store/columns.h"

#include <algorithm>
#include <charconv>
#include <iterator>

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
    {"id", Kind::Number, Shown::Always, number<&Record::id>},
    {"ldate", Kind::Text, Shown::Always, text<&Record::ldate>},
    {"ltime", Kind::Text, Shown::Always, text<&Record::ltime>},
    {"utcsec", Kind::Number, Shown::InFull, number<&Record::utcsec>},
    {"tzoffset", Kind::Text, Shown::InFull, text<&Record::tzoffset>},
    {"host", Kind::Text, Shown::Always, text<&Record::host>},
    {"ip", Kind::Text, Shown::InFull, text<&Record::ip>},
    {"fac", Kind::Text, Shown::Always, text<&Record::fac>},
    {"prio", Kind::Level, Shown::Always, level},
    {"tag", Kind::Text, Shown::InFull, text<&Record::tag>},
    {"prog", Kind::Text, Shown::InFull, text<&Record::prog>},
    {"prog", Kind::Text, Shown::InBrief, process},
    {"msg", Kind::Text, Shown::Always, text<&Record::msg>},
    {"pid", Kind::Text, Shown::InFull, text<&Record::pid>},
    {"msgid", Kind::Text, Shown::InFull, text<&Record::msgid>},
    {"sdata", Kind::Text, Shown::InFull, text<&Record::sdata>},
    {"rsec", Kind::Number, Shown::InFull, received},
};

constexpr Column kSystemLogs[] = {
    {"id", Kind::Number, Shown::Always, number<&Record::id>},
    {"ldate", Kind::Text, Shown::Always, text<&Record::ldate>},
    {"ltime", Kind::Text, Shown::Always, text<&Record::ltime>},
    {"host", Kind::Text, Shown::Always, text<&Record::host>},
    {"llevel", Kind::Level, Shown::Always, level},
    {"prog", Kind::Text, Shown::Always, text<&Record::prog>},
    {"luser", Kind::Text, Shown::Always, text<&Record::luser>},
    {"msg", Kind::Text, Shown::Always, text<&Record::event>},
};

constexpr Column kTransfers[] = {
    {"id", Kind::Number, Shown::Always, number<&Record::id>},
    {"ldate", Kind::Text, Shown::Always, text<&Record::ldate>},
    {"ltime", Kind::Text, Shown::Always, text<&Record::ltime>},
    {"host", Kind::Text, Shown::Always, text<&Record::host>},
    {"ip", Kind::Text, Shown::Always, text<&Record::xferip>},
    {"prog", Kind::Text, Shown::Always, text<&Record::prog>},
    {"luser", Kind::Text, Shown::Always, text<&Record::luser>},
    {"event", Kind::Text, Shown::Always, text<&Record::event>},
    {"isdir", Kind::Number, Shown::InFull, number<&Record::isdir>},
    {"fsize", Kind::Text, Shown::Always, text<&Record::fsize>},
    {"fname", Kind::Text, Shown::Always, text<&Record::fname>},
};

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

bool HasColumn(const std::string& table, std::string_view name) {
    if (table == "logs" && name == "llevel") {
        return true;  // a second name of prio, there for the search
    }
    const std::vector<Column> columns = ColumnsOf(table, false);
    return std::any_of(columns.begin(), columns.end(), [name](const Column& column) { return column.name == name; });
}

}  // namespace quor::store

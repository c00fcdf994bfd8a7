#include "store/columns.h"

#include <algorithm>
#include <charconv>
#include <iterator>

namespace quor::store {
namespace {

template <auto Member>
std::string_view text(const Record& record, Digits&) {
    return record.*Member;
}

template <auto Member>
std::string_view number(const Record& record, Digits& digits) {
    const auto end = std::to_chars(digits.begin(), digits.end(), record.*Member);
    return {digits.data(), static_cast<size_t>(end.ptr - digits.data())};
}

std::string_view level(const Record& record, Digits&) {
    const auto index = static_cast<size_t>(record.prio);
    return index < std::size(g_MappingSyslogPrior) ? g_MappingSyslogPrior[index] : "";
}

// Empty for a row of a database that does not know.
std::string_view received(const Record& record, Digits& digits) {
    return record.rsec == 0 ? std::string_view() : number<&Record::rsec>(record, digits);
}

constexpr Column kLogs[] = {
    {"id", Kind::Number, true, number<&Record::id>},
    {"ldate", Kind::Text, true, text<&Record::ldate>},
    {"ltime", Kind::Text, true, text<&Record::ltime>},
    {"utcsec", Kind::Number, false, number<&Record::utcsec>},
    {"tzoffset", Kind::Text, false, text<&Record::tzoffset>},
    {"host", Kind::Text, true, text<&Record::host>},
    {"ip", Kind::Text, false, text<&Record::ip>},
    {"fac", Kind::Text, true, text<&Record::fac>},
    {"prio", Kind::Level, true, level},
    {"tag", Kind::Text, false, text<&Record::tag>},
    {"prog", Kind::Text, true, text<&Record::prog>},
    {"msg", Kind::Text, true, text<&Record::msg>},
    {"pid", Kind::Text, false, text<&Record::pid>},
    {"msgid", Kind::Text, false, text<&Record::msgid>},
    {"sdata", Kind::Text, false, text<&Record::sdata>},
    {"rsec", Kind::Number, false, received},
};

constexpr Column kSystemLogs[] = {
    {"id", Kind::Number, true, number<&Record::id>},
    {"ldate", Kind::Text, true, text<&Record::ldate>},
    {"ltime", Kind::Text, true, text<&Record::ltime>},
    {"host", Kind::Text, true, text<&Record::host>},
    {"llevel", Kind::Level, true, level},
    {"prog", Kind::Text, true, text<&Record::prog>},
    {"luser", Kind::Text, true, text<&Record::luser>},
    {"msg", Kind::Text, true, text<&Record::event>},
};

constexpr Column kTransfers[] = {
    {"id", Kind::Number, true, number<&Record::id>},        {"ldate", Kind::Text, true, text<&Record::ldate>},
    {"ltime", Kind::Text, true, text<&Record::ltime>},      {"host", Kind::Text, true, text<&Record::host>},
    {"ip", Kind::Text, true, text<&Record::xferip>},        {"prog", Kind::Text, true, text<&Record::prog>},
    {"luser", Kind::Text, true, text<&Record::luser>},      {"event", Kind::Text, true, text<&Record::event>},
    {"isdir", Kind::Number, false, number<&Record::isdir>}, {"fsize", Kind::Text, true, text<&Record::fsize>},
    {"fname", Kind::Text, true, text<&Record::fname>},
};

}  // namespace

std::vector<Column> ColumnsOf(const std::string& table) {
    if (table == "logs") {
        return {std::begin(kLogs), std::end(kLogs)};
    }
    if (table == "transfer_log") {
        return {std::begin(kTransfers), std::end(kTransfers)};
    }
    return {std::begin(kSystemLogs), std::end(kSystemLogs)};
}

bool HasColumn(const std::string& table, _SYSLOG_DB_ATTRI_tag attribute) {
    if (table == "logs" && attribute == SYSLOG_ATTRI_LLEVEL) {
        return true;  // a second name of prio, there for the search
    }
    const std::string_view name = LogAttriStrGet(attribute);
    const std::vector<Column> columns = ColumnsOf(table);
    return std::any_of(columns.begin(), columns.end(), [name](const Column& column) { return column.name == name; });
}

}  // namespace quor::store

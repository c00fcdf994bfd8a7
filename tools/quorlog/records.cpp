#include "records.h"

#include <algorithm>
#include <charconv>

namespace quor::cli {
namespace {

using Record = _SYSLOG_LOG_DATA_tag;

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

constexpr Field kLogs[] = {
    {{"id", Kind::Number}, true, number<&Record::id>},
    {{"ldate"}, true, text<&Record::ldate>},
    {{"ltime"}, true, text<&Record::ltime>},
    {{"utcsec", Kind::Number}, false, number<&Record::utcsec>},
    {{"tzoffset"}, false, text<&Record::tzoffset>},
    {{"host"}, true, text<&Record::host>},
    {{"ip"}, false, text<&Record::ip>},
    {{"fac"}, true, text<&Record::fac>},
    {{"prio", Kind::Level}, true, level},
    {{"tag"}, false, text<&Record::tag>},
    {{"prog"}, true, text<&Record::prog>},
    {{"msg"}, true, text<&Record::msg>},
};

constexpr Field kSystemLogs[] = {
    {{"id", Kind::Number}, true, number<&Record::id>},
    {{"ldate"}, true, text<&Record::ldate>},
    {{"ltime"}, true, text<&Record::ltime>},
    {{"host"}, true, text<&Record::host>},
    {{"llevel", Kind::Level}, true, level},
    {{"prog"}, true, text<&Record::prog>},
    {{"luser"}, true, text<&Record::luser>},
    {{"msg"}, true, text<&Record::event>},
};

constexpr Field kTransfers[] = {
    {{"id", Kind::Number}, true, number<&Record::id>},
    {{"ldate"}, true, text<&Record::ldate>},
    {{"ltime"}, true, text<&Record::ltime>},
    {{"host"}, true, text<&Record::host>},
    {{"ip"}, true, text<&Record::xferip>},
    {{"prog"}, true, text<&Record::prog>},
    {{"luser"}, true, text<&Record::luser>},
    {{"event"}, true, text<&Record::event>},
    {{"isdir", Kind::Number}, false, number<&Record::isdir>},
    {{"fsize"}, true, text<&Record::fsize>},
    {{"fname"}, true, text<&Record::fname>},
};

std::vector<Field> fieldsOf(const std::string& table) {
    if (table == "logs") {
        return {std::begin(kLogs), std::end(kLogs)};
    }
    if (table == "transfer_log") {
        return {std::begin(kTransfers), std::end(kTransfers)};
    }
    return {std::begin(kSystemLogs), std::end(kSystemLogs)};
}

}  // namespace

bool HasColumn(const std::string& table, _SYSLOG_DB_ATTRI_tag attribute) {
    if (table == "logs" && attribute == SYSLOG_ATTRI_LLEVEL) {
        return true;  // a second name of prio, there for the search
    }
    const std::string_view name = LogAttriStrGet(attribute);
    const std::vector<Field> fields = fieldsOf(table);
    return std::any_of(fields.begin(), fields.end(), [&](const Field& field) { return field.column.name == name; });
}

RecordSink::RecordSink(const Style& style, const std::string& table, Output& out) : fields_(fieldsOf(table)) {
    if (style.format == Format::Table) {
        fields_.erase(std::remove_if(fields_.begin(), fields_.end(), [](const Field& field) { return !field.brief; }),
                      fields_.end());
    }
    Columns columns;
    for (const Field& field : fields_) {
        columns.push_back(field.column);
    }
    digits_.resize(fields_.size());
    cells_.resize(fields_.size());
    sink_ = MakeSink(style, std::move(columns), out);
}

void RecordSink::add(const _SYSLOG_LOG_DATA_tag& record) {
    for (size_t i = 0; i < fields_.size(); ++i) {
        cells_[i] = fields_[i].read(record, digits_[i]);
    }
    sink_->row(cells_);
}

}  // namespace quor::cli

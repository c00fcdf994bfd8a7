#include "tools/quorlog/records.h"

#include <algorithm>

namespace quor::cli {

RecordSink::RecordSink(const Style& style, const std::string& table, Output& out) : fields_(store::ColumnsOf(table)) {
    if (style.format == Format::Table) {
        const auto isLong = [](const store::Column& field) { return !field.brief; };
        fields_.erase(std::remove_if(fields_.begin(), fields_.end(), isLong), fields_.end());
    }
    Columns columns;
    for (const store::Column& field : fields_) {
        columns.push_back({field.name, field.kind});
    }
    digits_.resize(fields_.size());
    cells_.resize(fields_.size());
    sink_ = MakeSink(style, std::move(columns), out);
}

void RecordSink::add(const store::Record& record) {
    for (size_t i = 0; i < fields_.size(); ++i) {
        cells_[i] = fields_[i].read(record, digits_[i]);
    }
    sink_->row(cells_);
}

}  // namespace quor::cli

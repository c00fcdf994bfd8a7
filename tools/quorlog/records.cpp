#include "tools/quorlog/records.h"

namespace quor::cli {

RecordSink::RecordSink(const Style& style, const std::string& table, Output& out)
    : fields_(store::ColumnsOf(table, style.format == Format::Table)), scratch_(fields_.size()) {
    Columns columns;
    for (const store::Column& field : fields_) {
        columns.push_back({field.name, field.kind});
    }
    cells_.resize(fields_.size());
    sink_ = MakeSink(style, std::move(columns), out);
}

void RecordSink::add(const store::Record& record) {
    for (size_t i = 0; i < fields_.size(); ++i) {
        cells_[i] = fields_[i].read(record, scratch_[i]);
    }
    sink_->row(cells_);
}

}  // namespace quor::cli

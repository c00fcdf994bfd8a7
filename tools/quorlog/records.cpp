#include "tools/quorlog/records.h"

namespace quor::cli {

RecordSink::RecordSink(const Style& style, const Shape& shape, Output& out)
    : context_(shape.context), marked_(shape.context && style.format == Format::Table) {
    const bool table = style.format == Format::Table;
    fields_ =
        shape.columns.empty() ? store::ColumnsOf(shape.table, table) : store::ColumnsNamed(shape.table, shape.columns);
    scratch_.resize(fields_.size());
    Columns columns;
    if (marked_) {
        columns.push_back({""});
    }
    for (const store::Column& field : fields_) {
        columns.push_back({table ? field.title : field.name, field.kind});
    }
    if (context_ && !marked_) {
        columns.push_back({"hit", Kind::Truth});
    }
    sink_ = MakeSink(style, std::move(columns), out);
}

void RecordSink::add(const store::Record& record, bool hit) {
    cells_.clear();
    if (marked_) {
        cells_.emplace_back(hit ? ">" : "");
    }
    for (size_t i = 0; i < fields_.size(); ++i) {
        cells_.push_back(fields_[i].read(record, scratch_[i]));
    }
    if (context_ && !marked_) {
        cells_.emplace_back(hit ? "true" : "false");
    }
    sink_->row(cells_);
}

}  // namespace quor::cli

#include "platform/archive/archivewriter.h"

#include <utility>

#include "platform/archive/copying.h"
#include "platform/archive/draft.h"

namespace quor::archive {
namespace {

constexpr uint64_t kRowsPerReport = 65536;
constexpr size_t kMostValues = 10000;  // of a column whose values are listed

}  // namespace

ArchiveWriter::ArchiveWriter(sqlite3* db, Definition columns)
    : db_(db), columns_(std::move(columns)), storage_(db, "main"), block_(columns_.size()),
      values_(columns_.size(), Values(std::in_place)), cells_(columns_.size()) {}

Tally ArchiveWriter::write(const Progress& progress) {
    CopyForArchive(db_);
    storage_.create();
    writeRows(progress);
    writeValues();
    Run(db_, ArchiveDefinition(columns_));
    tally_.sum = sum_.value();
    Remember(storage_, "rows", tally_.rows);
    Remember(storage_, "checksum", tally_.sum);
    return tally_;
}

void ArchiveWriter::writeRows(const Progress& progress) {
    const Statement rows = Prepared(db_, EveryRow(columns_, "source"));
    while (NextRow(db_, rows)) {
        addRow(rows.get());
        if (++tally_.rows % kRowsPerReport == 0) {
            progress(tally_.rows);
        }
    }
    if (!block_.empty()) {
        finishBlock();
    }
}

void ArchiveWriter::addRow(sqlite3_stmt* row) {
    const sqlite3_int64 id = sqlite3_column_int64(row, 0);
    size_t bytes = 0;
    sum_.begin(id);
    for (size_t i = 0; i < cells_.size(); ++i) {
        cells_[i] = columns_[i].id ? Cell() : CellOf(sqlite3_column_value(row, static_cast<int>(i) + 1));
        bytes += cells_[i].bytes.size();
        sum_.add(cells_[i]);
        if (cells_[i].bytes.size() > kLongestValue) {
            throw Problem("row " + std::to_string(id) +
                          " has a value of more than 16 MiB, which no archive takes; "
                          "shorten or delete it");
        }
    }
    sum_.end();
    if (block_.full(bytes)) {
        finishBlock();
    }
    block_.beginRow(id);
    for (size_t i = 0; i < cells_.size(); ++i) {
        block_.addCell(i, cells_[i]);
    }
}

void ArchiveWriter::finishBlock() {
    storage_.add(block_.finish(), block_.first());
    for (size_t i = 0; i < columns_.size(); ++i) {
        count(i);
    }
    block_.clear();
}

void ArchiveWriter::count(size_t column) {
    Values& values = values_[column];
    if (!values) {
        return;
    }
    const Entries entries = block_.column(column).entries();
    for (const Entry& entry : entries) {
        std::string cell;
        PutCell(cell, entry.cell);
        (*values)[cell] += entry.rows;
    }
    if (entries.empty() || values->size() > kMostValues) {
        values.reset();
    }
}

void ArchiveWriter::writeValues() {
    Run(db_, "CREATE TABLE main.logs_columns (number INTEGER PRIMARY KEY, name TEXT, listing INTEGER);"
             "CREATE TABLE main.logs_values (name TEXT, value, rows INTEGER);"
             "CREATE INDEX main.logs_values_idx ON logs_values (name, value)");
    const Statement addColumn = Prepared(db_, "INSERT INTO main.logs_columns VALUES (?1, ?2, ?3)");
    const Statement addValue = Prepared(db_, "INSERT INTO main.logs_values VALUES (?1, ?2, ?3)");
    for (size_t i = 0; i < columns_.size(); ++i) {
        const std::string& name = columns_[i].name;
        const bool listed = values_[i] && !columns_[i].id;
        sqlite3_bind_int64(addColumn.get(), 1, static_cast<int64_t>(i));
        sqlite3_bind_text64(addColumn.get(), 2, name.data(), name.size(), SQLITE_STATIC, SQLITE_UTF8);
        sqlite3_bind_int(addColumn.get(), 3, !listed ? 0 : columns_[i].indexed ? 2 : 1);
        (void)NextRow(db_, addColumn);
        sqlite3_reset(addColumn.get());
        if (!listed) {
            continue;
        }
        for (const auto& [text, rows] : *values_[i]) {
            Bytes bytes(text);
            sqlite3_bind_text64(addValue.get(), 1, name.data(), name.size(), SQLITE_STATIC, SQLITE_UTF8);
            Require(db_, Bind(addValue.get(), 2, TakeCell(bytes)));
            sqlite3_bind_int64(addValue.get(), 3, static_cast<int64_t>(rows));
            (void)NextRow(db_, addValue);
            sqlite3_reset(addValue.get());
        }
    }
}

}  // namespace quor::archive

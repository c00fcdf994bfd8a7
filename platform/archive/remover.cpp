#include "platform/archive/remover.h"

#include <algorithm>
#include <map>

#include "platform/archive/audit.h"
#include "platform/archive/rowsum.h"

namespace quor::archive {

// False when there is no such block. One that is damaged cannot be written anew, and none of its rows is ever found.
bool Remover::open(int64_t id) {
    const std::optional<int64_t> key = storage_.keyFor(id);
    if (!key) {
        return false;
    }
    doomed_ = std::make_unique<Doomed>(storage_);
    doomed_->block = std::make_unique<Block>(doomed_->parts, *key, storage_.head(*key), columns_.size());
    return true;
}

void Remover::remove(int64_t id) {
    const bool here = doomed_ != nullptr && doomed_->block->head().first <= id && id <= doomed_->block->head().last;
    if (!here) {
        flush();
    }
    if (here || open(id)) {
        doomed_->ids.push_back(id);
    }
}

std::vector<bool> Remover::doomedRows() const {
    std::vector<bool> rows(doomed_->block->rows());
    std::sort(doomed_->ids.begin(), doomed_->ids.end());
    for (size_t row = 0; row < rows.size(); ++row) {
        rows[row] = std::binary_search(doomed_->ids.begin(), doomed_->ids.end(), doomed_->block->id(row));
    }
    return rows;
}

void Remover::flush() {
    if (doomed_ == nullptr) {
        return;
    }
    const std::vector<bool> rows = doomedRows();
    subtract(rows);
    uncount(rows);
    rewrite(rows);
    forget();
}

void Remover::forget() {
    doomed_.reset();
}

// How many rows there are, and their checksum.
void Remover::subtract(const std::vector<bool>& doomed) {
    RowSum sum;
    uint64_t rows = 0;
    for (size_t row = 0; row < doomed.size(); ++row) {
        if (!doomed[row]) {
            continue;
        }
        ++rows;
        sum.begin(doomed_->block->id(row));
        for (size_t i = 0; i < columns_.size(); ++i) {
            sum.add(doomed_->block->column(i).at(row));
        }
        sum.end();
    }
    Remember(storage_, "rows", Remembered(storage_, "rows") - rows);
    Remember(storage_, "checksum", Remembered(storage_, "checksum") - sum.value());
}

// The list of values, too, must not know what is gone.
void Remover::uncount(const std::vector<bool>& doomed) {
    sqlite3* const db = storage_.db();
    const std::string list = storage_.table("logs_values");
    const Statement lower = Prepared(db, "UPDATE " + list + " SET rows = rows - ?3 WHERE name = ?1 AND value IS ?2");
    for (size_t i = 0; i < columns_.size(); ++i) {
        std::map<std::string, uint64_t> lost;  // by the written form of the value
        for (size_t row = 0; row < doomed.size(); ++row) {
            if (doomed[row]) {
                std::string cell;
                PutCell(cell, doomed_->block->column(i).at(row));
                ++lost[cell];
            }
        }
        for (const auto& [text, rows] : lost) {
            Bytes bytes(text);
            sqlite3_bind_text64(lower.get(), 1, columns_[i].data(), columns_[i].size(), SQLITE_STATIC, SQLITE_UTF8);
            Require(db, Bind(lower.get(), 2, TakeCell(bytes)));
            sqlite3_bind_int64(lower.get(), 3, static_cast<int64_t>(rows));
            (void)NextRow(db, lower);
            sqlite3_reset(lower.get());
        }
    }
    Run(db, "DELETE FROM " + list + " WHERE rows <= 0");
}

void Remover::rewrite(const std::vector<bool>& doomed) {
    Block& block = *doomed_->block;
    BlockWriter writer(columns_.size());
    for (size_t row = 0; row < doomed.size(); ++row) {
        if (doomed[row]) {
            continue;
        }
        writer.beginRow(block.id(row));
        for (size_t i = 0; i < columns_.size(); ++i) {
            writer.addCell(i, block.column(i).at(row));
        }
    }
    if (writer.empty()) {
        storage_.remove(block.key());
    } else {
        storage_.replace(writer.finish(), block.key());
    }
}

}  // namespace quor::archive

#include <utility>

#include "platform/archive/table.h"

namespace quor::archive {

Cursor::Cursor(Table& table) : sqlite3_vtab_cursor(), table_(table), parts_(table.storage) {}

void Cursor::ask(Question question) {
    question_ = std::move(question);
    values_.reset();
    block_.reset();
    rows_.clear();
    at_ = 0;
    ended_ = question_.nothing || question_.least > question_.most;
    if (ended_) {
        return;
    }
    const Storage& storage = table_.storage;
    const std::optional<int64_t> start = storage.keyFor(question_.least);
    heads_ =
        Prepared(storage.db(), "SELECT id, head FROM " + storage.table("logs_blocks") +
                                   " WHERE id >= ?1 AND id <= ?2 ORDER BY id" + (question_.descending ? " DESC" : ""));
    sqlite3_bind_int64(heads_.get(), 1, start.value_or(question_.least));
    sqlite3_bind_int64(heads_.get(), 2, question_.most);
    nextBlock();
}

void Cursor::next() {
    if (values_ != nullptr) {
        nextValue();
    } else if (++at_ == rows_.size()) {
        nextBlock();
    }
}

// A search that left rows out would look whole.
void Cursor::nextBlock() {
    sqlite3* const db = table_.storage.db();
    while (NextRow(db, heads_)) {
        const int64_t key = sqlite3_column_int64(heads_.get(), 0);
        try {
            if (enter(key, TextOf(heads_, 1))) {
                return;
            }
        } catch (const Damaged& damage) {
            if (table_.damage == Damage::Fails) {
                throw Damaged("the block of the ids from " + std::to_string(key) + " on is damaged (" + damage.what() +
                              ")");
            }
        }
    }
    heads_.reset();
    ended_ = true;
}

// What is wanted of a block is expanded at once, so that all of its rows are sound or none is handed over.
bool Cursor::enter(int64_t key, const std::string& head) {
    at_ = 0;
    used_.assign(table_.shape.columns.size(), {});
    block_ = std::make_unique<Block>(parts_, key, head, used_.size());
    if (!question_.mayConcern(*block_) || !question_.mayConcernWords(*block_)) {
        return false;
    }
    rows_ = question_.rowsOf(*block_);
    if (rows_.empty()) {
        return false;
    }
    (void)block_->id(rows_.front());
    for (size_t i = 0; i < used_.size(); ++i) {
        if (question_.wants(i) && i != table_.shape.id) {
            use(i);
        }
    }
    if (question_.descending) {
        std::reverse(rows_.begin(), rows_.end());
    }
    return true;
}

void Cursor::use(size_t number) {
    Column& column = block_->column(number);
    used_[number] = {&column, column.keep(table_.keepsake) ? Lasting::Always : Lasting::Now};
}

int64_t Cursor::id() {
    if (values_ != nullptr) {
        throw Unanswered("this statement asks for values only; name the column id in place of rowid");
    }
    return block_->id(rows_[at_]);
}

void Cursor::column(sqlite3_context* context, size_t number) {
    if (values_ != nullptr) {
        sqlite3_result_value(context, sqlite3_column_value(values_.get(), 0));
        return;
    }
    if (number == table_.shape.id) {
        sqlite3_result_int64(context, id());
        return;
    }
    if (used_[number].column == nullptr) {
        use(number);
    }
    SetResult(context, used_[number].column->at(rows_[at_]), used_[number].lasting);
}

void Cursor::askForValues(size_t column, int number) {
    const Storage& storage = table_.storage;
    values_ =
        Prepared(storage.db(), "SELECT value, rows FROM " + storage.table("logs_values") +
                                   " WHERE name = ?1 ORDER BY value" + ((number & kDescending) != 0 ? " DESC" : ""));
    const std::string& name = table_.shape.columns[column].name;
    sqlite3_bind_text64(values_.get(), 1, name.data(), name.size(), SQLITE_STATIC, SQLITE_UTF8);
    once_ = (number & kDistinctOnly) != 0;
    repeats_ = 1;
    ended_ = false;
    nextValue();
}

void Cursor::nextValue() {
    if (--repeats_ > 0) {
        return;
    }
    ended_ = !NextRow(table_.storage.db(), values_);
    repeats_ =
        once_ || ended_ ? 1 : static_cast<uint64_t>(std::max<int64_t>(sqlite3_column_int64(values_.get(), 1), 1));
}

}  // namespace quor::archive

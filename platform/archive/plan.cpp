// From SQLite's constraints to a question.
#include <cstdlib>
#include <string>

#include "platform/archive/question.h"

namespace quor::archive {
namespace {

constexpr double kRows = 1e6;  // of a table, for the planner: what counts is how plans compare

const char* operationOf(unsigned char constraint) {
    switch (constraint) {
    case SQLITE_INDEX_CONSTRAINT_EQ:
        return "=";
    case SQLITE_INDEX_CONSTRAINT_LT:
        return "<";
    case SQLITE_INDEX_CONSTRAINT_LE:
        return "L";
    case SQLITE_INDEX_CONSTRAINT_GT:
        return ">";
    case SQLITE_INDEX_CONSTRAINT_GE:
        return "G";
    case SQLITE_INDEX_CONSTRAINT_GLOB:
        return "g";
    case SQLITE_INDEX_CONSTRAINT_LIKE:
        return "l";
    default:
        return nullptr;
    }
}

bool isPattern(char operation) {
    return operation == 'g' || operation == 'l';
}

// What part of the rows is left by a condition, roughly.
double shareOf(char operation, bool id) {
    if (operation == '=') {
        return id ? 1 / kRows : 0.2;
    }
    return id ? 0.25 : 0.5;
}

// Writes down the conditions that are of use.
class Planner {
  public:
    Planner(const Shape& shape, sqlite3_index_info* info) : shape_(shape), info_(info) {}

    void consider(int i) {
        const auto& constraint = info_->aConstraint[i];
        const char* operation = operationOf(constraint.op);
        if (constraint.usable == 0 || operation == nullptr) {
            return;
        }
        const bool id = shape_.isId(constraint.iColumn);
        if (id ? isPattern(*operation) : !usable(i, *operation)) {
            return;
        }
        // All names of a list at once, which keeps the rows in their order.
        const bool list = !id && *operation == '=' && sqlite3_vtab_in(info_, i, 1) != 0;
        plan_ += (list ? "i" : operation) + std::to_string(id ? -1 : constraint.iColumn) + ";";
        info_->aConstraintUsage[i].argvIndex = ++arguments_;
        share_ *= shareOf(*operation, id);
        unique_ = unique_ || (id && *operation == '=');
    }

    int finish() {
        info_->idxStr = sqlite3_mprintf("%llu;%s", info_->colUsed, plan_.c_str());
        info_->needToFreeIdxStr = 1;
        info_->estimatedRows = static_cast<sqlite3_int64>(kRows * share_) + 1;
        info_->estimatedCost = unique_ ? 20 : kRows * share_ + 100;
        info_->idxFlags = unique_ ? SQLITE_INDEX_SCAN_UNIQUE : 0;
        return info_->idxStr != nullptr ? SQLITE_OK : SQLITE_NOMEM;
    }

  private:
    bool usable(int i, char operation) const {
        return shape_.columns[static_cast<size_t>(info_->aConstraint[i].iColumn)].text &&
               (isPattern(operation) || sqlite3_stricmp(sqlite3_vtab_collation(info_, i), "BINARY") == 0);
    }

    const Shape& shape_;
    sqlite3_index_info* info_;
    std::string plan_;
    int arguments_ = 0;
    double share_ = 1;
    bool unique_ = false;
};

// Whether only the values of one column are wanted, in their order or each once.
bool wantsValues(const Shape& shape, const sqlite3_index_info* info) {
    if (info->nOrderBy != 1 || info->nConstraint != 0 || shape.isId(info->aOrderBy[0].iColumn)) {
        return false;
    }
    const int column = info->aOrderBy[0].iColumn;
    return column < 63 && info->colUsed == sqlite3_uint64{1} << column;
}

bool planValues(const Shape& shape, sqlite3_index_info* info, const std::function<Listing(size_t)>& listing) {
    constexpr int kAnyOrder = 2;
    if (!wantsValues(shape, info)) {
        return false;
    }
    const auto column = static_cast<size_t>(info->aOrderBy[0].iColumn);
    const int distinct = sqlite3_vtab_distinct(info);
    const Listing listed = listing(column);
    if (listed == Listing::No || (distinct == kAnyOrder && listed != Listing::Sorted)) {
        return false;
    }
    info->idxNum = kValuesOnly | (distinct >= kAnyOrder ? kDistinctOnly : 0);
    info->idxStr = sqlite3_mprintf("%d", static_cast<int>(column));
    info->needToFreeIdxStr = 1;
    info->estimatedCost = 100;
    info->orderByConsumed = 1;
    return info->idxStr != nullptr;
}

std::string textOf(sqlite3_value* value) {
    const Cell cell = CellOf(value);
    return std::string(cell.bytes);
}

// False when a value is no text: then the term says nothing.
bool takeList(sqlite3_value* list, Term& term) {
    sqlite3_value* value = nullptr;
    int status = sqlite3_vtab_in_first(list, &value);
    for (; status == SQLITE_OK && value != nullptr; status = sqlite3_vtab_in_next(list, &value)) {
        if (sqlite3_value_type(value) == SQLITE_TEXT) {
            term.values.push_back(textOf(value));
        } else if (sqlite3_value_type(value) != SQLITE_NULL) {
            return false;
        }
    }
    return status == SQLITE_DONE || status == SQLITE_OK;
}

bool takeValue(sqlite3_value* value, Term& term) {
    if (term.how == Compared::Among) {
        return takeList(value, term);
    }
    if (sqlite3_value_type(value) != SQLITE_TEXT) {
        return false;
    }
    term.values.push_back(textOf(value));
    const std::string_view pattern = term.values.front().c_str();  // a zero byte ends a pattern
    if (term.how == Compared::Glob) {
        term.trigrams = TrigramsOfGlob(pattern);
        term.part = TextOfGlob(pattern);
    } else if (term.how == Compared::Like) {
        term.trigrams = TrigramsOfLike(pattern);
    }
    return true;
}

void takeId(sqlite3_value* value, Compared how, Question& question) {
    if (sqlite3_value_type(value) == SQLITE_NULL) {
        question.nothing = true;
    }
    if (sqlite3_value_type(value) != SQLITE_INTEGER) {
        return;
    }
    const sqlite3_int64 id = sqlite3_value_int64(value);
    if (how == Compared::Equal || how == Compared::Above || how == Compared::AtLeast) {
        question.least = std::max<int64_t>(question.least, id);
    }
    if (how == Compared::Equal || how == Compared::Below || how == Compared::AtMost) {
        question.most = std::min<int64_t>(question.most, id);
    }
}

}  // namespace

int Plan(const Shape& shape, sqlite3_index_info* info, const std::function<Listing(size_t column)>& listing) {
    if (planValues(shape, info, listing)) {
        info->idxNum |= info->aOrderBy[0].desc != 0 ? kDescending : 0;
        return SQLITE_OK;
    }
    Planner planner(shape, info);
    for (int i = 0; i < info->nConstraint; ++i) {
        planner.consider(i);
    }
    if (info->nOrderBy > 0 && shape.isId(info->aOrderBy[0].iColumn)) {
        info->orderByConsumed = 1;
        info->idxNum = info->aOrderBy[0].desc != 0 ? kDescending : 0;
    }
    return planner.finish();
}

Question Ask(const Shape& shape, int number, const char* plan, sqlite3_value** values) {
    Question question;
    question.descending = (number & kDescending) != 0;
    char* terms = nullptr;
    question.columns = strtoull(plan, &terms, 10);
    plan = terms + 1;
    for (int i = 0; *plan != '\0'; ++i) {
        Term term;
        term.how = static_cast<Compared>(*plan);
        char* end = nullptr;
        const long column = strtol(plan + 1, &end, 10);
        plan = end + 1;
        term.column = static_cast<size_t>(column);
        if (column < 0) {
            takeId(values[i], term.how, question);
        } else if (term.column < shape.columns.size() && takeValue(values[i], term)) {
            question.terms.push_back(std::move(term));
        }
    }
    return question;
}

}  // namespace quor::archive

// The columns of the log tables: what a filter can ask for, and what a record shows of itself.
#ifndef STORE_COLUMNS_H
#define STORE_COLUMNS_H

#include <array>
#include <string>
#include <string_view>
#include <vector>

#include "store/record.h"

namespace quor::store {

constexpr std::array<const char*, 4> kLogTables = {"logs", "general_log", "connection_log", "transfer_log"};

enum class Kind {
    Text,
    Number,  // valid JSON numbers, or empty
    Level,   // a severity's name
    Truth,   // true or false
};

// Columns for where there is little room, for where everything is wanted, and for both.
enum class Shown { Always, InFull, InBrief };

// One column of a table and how a record fills it.
struct Column {
    const char* name;   // in the database
    const char* title;  // for people: the name of the filter, where there is one
    Kind kind;
    Shown shown;
    // The text, which may be made in `scratch` and then lasts as long as that.
    std::string_view (*read)(const Record& record, std::string& scratch);
};

std::vector<Column> ColumnsOf(const std::string& table, bool brief);

// The columns of a list of names and titles, separated by commas, in its order; name and title of each are as the list
// has it. Failure, which says what there is, for one that the table does not have, and for one named twice.
std::vector<Column> ColumnsNamed(const std::string& table, const std::string& list);

bool HasColumn(const std::string& table, std::string_view name);

}  // namespace quor::store

#endif

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
};

// Columns for where there is little room, for where everything is wanted, and for both.
enum class Shown { Always, InFull, InBrief };

// One column of a table and how a record fills it.
struct Column {
    const char* name;
    Kind kind;
    Shown shown;
    // The text, which may be made in `scratch` and then lasts as long as that.
    std::string_view (*read)(const Record& record, std::string& scratch);
};

std::vector<Column> ColumnsOf(const std::string& table, bool brief);

bool HasColumn(const std::string& table, std::string_view name);

}  // namespace quor::store

#endif

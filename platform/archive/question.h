// What a search asks of the rows, as far as whole blocks and rows can be left out by it. SQLite looks at every row that
// is handed over once more, so all that matters here is that nothing is left out that it would take.
#ifndef PLATFORM_ARCHIVE_QUESTION_H
#define PLATFORM_ARCHIVE_QUESTION_H

#include <sqlite3.h>

#include <algorithm>
#include <cstdint>
#include <functional>
#include <limits>
#include <string>
#include <vector>

#include "platform/archive/block.h"
#include "platform/archive/trigrams.h"

namespace quor::archive {

// What the planner must know of the columns of a table.
struct Shape {
    struct Column {
        std::string name;
        bool text = false;  // compares as text
    };

    std::vector<Column> columns;
    size_t id = SIZE_MAX;  // the column that is the row number

    bool isId(int column) const { return column < 0 || static_cast<size_t>(column) == id; }
};

// How a value is compared, as it stands in a plan.
enum class Compared : char {
    Equal = '=',
    Among = 'i',
    Below = '<',
    AtMost = 'L',
    Above = '>',
    AtLeast = 'G',
    Glob = 'g',
    Like = 'l',
};

// One condition on a column of texts; a row must meet them all.
struct Term {
    size_t column = 0;
    Compared how = Compared::Equal;
    std::vector<std::string> values;
    Trigrams trigrams;  // of a pattern
    std::string part;   // of a pattern that asks for texts with this part
};

struct Question {
    int64_t least = std::numeric_limits<int64_t>::min();  // row numbers
    int64_t most = std::numeric_limits<int64_t>::max();
    bool nothing = false;  // no row can meet it
    bool descending = false;
    std::vector<Term> terms;
    uint64_t columns = 0;  // that are wanted, a bit for each; the last for itself and all that follow

    bool wants(size_t column) const { return (columns >> std::min<size_t>(column, 63) & 1U) != 0; }
    // Whether a row of the block may meet it, by the head alone, and by the filter of words.
    bool mayConcern(const Block& block) const;
    bool mayConcernWords(const Block& block) const;
    // The rows of the block that may meet it, ascending.
    std::vector<uint32_t> rowsOf(Block& block) const;
};

// Whether the distinct values of a column are listed, and come in their order when nobody asks for one.
enum class Listing { No, Yes, Sorted };

// How a search is to be answered, in the number of a plan.
constexpr int kDescending = 1;
constexpr int kValuesOnly = 2;    // of one column, each as often as it occurs
constexpr int kDistinctOnly = 4;  // or once

// Chooses the conditions that a question is made of and the order of the rows, and writes it into `info`.
int Plan(const Shape& shape, sqlite3_index_info* info, const std::function<Listing(size_t column)>& listing);

// The question that was planned, with its values.
Question Ask(const Shape& shape, int number, const char* plan, sqlite3_value** values);

}  // namespace quor::archive

#endif

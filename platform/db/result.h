// A result complete in itself: every row one record of the arena, found by its number.
#ifndef PLATFORM_DB_RESULT_H
#define PLATFORM_DB_RESULT_H

#include <sqlite3.h>

#include <cstdint>
#include <string>
#include <vector>

#include "platform/db/arena.h"
#include "quor/quordb.h"

struct DBResult_tag {
  public:
    // ---- building: the columns first, then each row of the statement, then finish()
    void setColumns(sqlite3_stmt* statement);
    // False when there is no room for the row.
    bool append(sqlite3_stmt* statement);
    bool finish();

    // ---- reading
    uint32_t rows() const { return rows_; }
    bool next(uint32_t& row);
    const char* field(uint32_t row, const char* name);

  private:
    using Position = quor::Arena::Position;

    struct Column {
        std::string name;
        size_t first;      // the first column of this name, which answers for all of them
        size_t successor;  // the column that was asked for after this one
    };
    enum class Written { Done, TooLong, NoRoom };  // too long for the width of its offsets

    template <typename Offset>
    Written write(sqlite3_stmt* statement, size_t& size);
    size_t find(const char* name) const;
    bool seek(uint32_t row);
    void moveTo(Position position);

    std::vector<Column> columns_;
    size_t last_ = 0;
    size_t expected_ = 0;
    quor::Arena arena_;
    std::vector<Position> marks_;  // of every 64th row
    uint32_t rows_ = 0;
    uint32_t next_ = 0;
    uint64_t current_ = UINT64_MAX;  // the row that was asked for last, and where it stands
    Position position_;
    const char* record_ = nullptr;
};

#endif

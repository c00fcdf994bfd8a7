// Log records as rows: which columns each table has.
#ifndef QUORLOG_RECORDS_H
#define QUORLOG_RECORDS_H

#include <array>
#include <memory>
#include <string>

#include "dbutil.h"
#include "output.h"

namespace quor::cli {

constexpr std::array<const char*, 4> kLogTables = {"logs", "general_log", "connection_log", "transfer_log"};

bool HasColumn(const std::string& table, _SYSLOG_DB_ATTRI_tag attribute);

// Text of a number, kept until the row is written.
using Digits = std::array<char, 24>;

// One column of a table and how a record fills it.
struct Field {
    Column column;
    bool brief;  // stands in the table for people
    std::string_view (*read)(const _SYSLOG_LOG_DATA_tag& record, Digits& digits);
};

// Writes log records; the names of the columns are those of the database.
class RecordSink {
  public:
    RecordSink(const Style& style, const std::string& table, Output& out);

    void add(const _SYSLOG_LOG_DATA_tag& record);
    void flush() { sink_->flush(); }
    void finish() { sink_->finish(); }

  private:
    std::vector<Field> fields_;
    std::vector<Digits> digits_;
    Cells cells_;
    std::unique_ptr<RowSink> sink_;
};

}  // namespace quor::cli

#endif

// Log records as rows of the output.
#ifndef QUORLOG_RECORDS_H
#define QUORLOG_RECORDS_H

#include <memory>
#include <string>
#include <vector>

#include "store/columns.h"
#include "tools/quorlog/output.h"

namespace quor::cli {

// What of the records is shown.
struct Shape {
    std::string table;
    std::string columns;   // names, separated by commas; empty: the usual ones
    bool context = false;  // tell hits from the rows around them
};

// Writes log records. A table has the titles of the columns, the other forms have their names in the database; columns
// that were chosen are called as they were chosen.
class RecordSink {
  public:
    RecordSink(const Style& style, const Shape& shape, Output& out);

    void add(const store::Record& record, bool hit = true);
    void gap() { sink_->gap(); }
    void flush() { sink_->flush(); }
    void finish() { sink_->finish(); }

  private:
    std::vector<store::Column> fields_;
    std::vector<std::string> scratch_;
    Cells cells_;
    bool context_;
    bool marked_;  // a table has its mark in front, the other forms have a field behind the others
    std::unique_ptr<RowSink> sink_;
};

}  // namespace quor::cli

#endif

// Log records as rows of the output.
#ifndef QUORLOG_RECORDS_H
#define QUORLOG_RECORDS_H

#include <memory>
#include <string>
#include <vector>

#include "store/columns.h"
#include "tools/quorlog/output.h"

namespace quor::cli {

// Writes log records; the names of the columns are those of the database.
class RecordSink {
  public:
    RecordSink(const Style& style, const std::string& table, Output& out);

    void add(const store::Record& record);
    void flush() { sink_->flush(); }
    void finish() { sink_->finish(); }

  private:
    std::vector<store::Column> fields_;
    std::vector<std::string> scratch_;
    Cells cells_;
    std::unique_ptr<RowSink> sink_;
};

}  // namespace quor::cli

#endif

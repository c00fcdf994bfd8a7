// Owners of the platform's handles, and the fields of a row.
//
//     quor::Connection connection(QUORDBConnect(nullptr, nullptr, nullptr, path));
//     quor::Result result;
//     if (QUORDBExecute(connection.get(), sql, quor::Adopt(result)) < 0) return -1;
//     for (quor::Row row(result.get()); row.next();) names.push_back(row["name"]);
#ifndef COMMON_HANDLES_H
#define COMMON_HANDLES_H

#include "base/guards.h"
#include "base/numbers.h"
#include "quor/quorcore.h"
#include "quor/quordb.h"

namespace quor {

using Connection = Guard<DBConnect_tag, QUORDBClose>;
using Result = Guard<DBResult_tag, QUORDBFreeResult>;
using StringTable = Guard<QLIBSZHASH, QLIBCSzHashFree>;
using StringList = Guard<QLIBSZLIST, QLIBCSzListFree>;
using PlatformText = Guard<char, QLIBCStrPut>;

// Walks over the rows of a result, or reads the row of a known number.
class Row {
  public:
    explicit Row(DBResult_tag* result, unsigned int number = 0) : result_(result), number_(number) {}

    // Goes on to the next row; false when there is none.
    bool next() { return QUORDBFetchRow(result_, &number_) >= 0; }
    unsigned int number() const { return number_; }
    // NULL and a missing column read as the empty text. The text belongs to the result.
    const char* operator[](const char* column) const { return OrEmpty(QUORDBFetchField(result_, number_, column)); }

  private:
    DBResult_tag* result_;
    unsigned int number_;
};

}  // namespace quor

#endif

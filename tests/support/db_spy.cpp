#include "tests/support/db_spy.h"

#include "quor/quordb.h"
#include "tests/support/real.h"

using quor::test::SpyOnDb;

namespace {

// Notes the call and makes it, unless it is to fail.
template <typename Function, typename... Arguments>
int spied(std::vector<std::string>& calls, const std::string& call, Function* function, const char* name,
          Arguments... arguments) {
    const std::string& failing = SpyOnDb().failing;
    calls.push_back(call);
    const bool fails = !failing.empty() && call.find(failing) != std::string::npos;
    return fails ? -1 : quor::test::Real(function, name)(arguments...);
}

}  // namespace

int QUORDBExecute(DBConnect_tag* connection, const char* sql, DBResult_tag** result) {
    return spied(SpyOnDb().statements, sql, QUORDBExecute, __func__, connection, sql, result);
}

int QUORDBSelectLimit(DBConnect_tag* connection, const char* sql, unsigned int count, unsigned int skip,
                      DBResult_tag** result) {
    const std::string window = " [" + std::to_string(count) + "," + std::to_string(skip) + "]";
    return spied(SpyOnDb().statements, sql + window, QUORDBSelectLimit, __func__, connection, sql, count, skip, result);
}

int QUORDBEscapeStringEX2(DBConnect_tag* connection, char* out, unsigned int outSize, const char* in,
                          unsigned int inLen) {
    return spied(SpyOnDb().escapes, "quotes", QUORDBEscapeStringEX2, __func__, connection, out, outSize, in, inLen);
}

int QUORDBEscapeBackslashEX2(DBConnect_tag* connection, char* out, unsigned int outSize, const char* in) {
    return spied(SpyOnDb().escapes, "backslashes", QUORDBEscapeBackslashEX2, __func__, connection, out, outSize, in);
}

int QUORDBFetchRow(DBResult_tag* result, unsigned int* row) {
    return SpyOnDb().rowsLeft-- == 0 ? -1 : quor::test::Real(QUORDBFetchRow, __func__)(result, row);
}

void QUORDBClose(DBConnect_tag* connection) {
    ++SpyOnDb().closed;
    quor::test::Real(QUORDBClose, __func__)(connection);
}

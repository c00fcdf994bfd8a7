#include "tests/support/db_spy.h"

#include "quor/quordb.h"
#include "tests/support/real.h"

namespace quor::test {

DbSpy& SpyOnDb() {
    static DbSpy spy;
    return spy;
}

}  // namespace quor::test

using quor::test::Real;
using quor::test::SpyOnDb;

namespace {

// False when it is to fail.
bool record(std::vector<std::string>& calls, const std::string& call) {
    const std::string& failing = SpyOnDb().failing;
    calls.push_back(call);
    return failing.empty() || call.find(failing) == std::string::npos;
}

}  // namespace

int QUORDBExecute(DBConnect_tag* connection, const char* sql, DBResult_tag** result) {
    return record(SpyOnDb().statements, sql) ? Real(QUORDBExecute, "QUORDBExecute")(connection, sql, result) : -1;
}

int QUORDBSelectLimit(DBConnect_tag* connection, const char* sql, unsigned int count, unsigned int skip,
                      DBResult_tag** result) {
    const std::string window = " [" + std::to_string(count) + "," + std::to_string(skip) + "]";
    return record(SpyOnDb().statements, sql + window)
               ? Real(QUORDBSelectLimit, "QUORDBSelectLimit")(connection, sql, count, skip, result)
               : -1;
}

int QUORDBEscapeStringEX2(DBConnect_tag* connection, char* out, unsigned int outSize, const char* in,
                          unsigned int inLen) {
    return record(SpyOnDb().escapes, std::string("quotes ") + in)
               ? Real(QUORDBEscapeStringEX2, "QUORDBEscapeStringEX2")(connection, out, outSize, in, inLen)
               : -1;
}

int QUORDBEscapeBackslashEX2(DBConnect_tag* connection, char* out, unsigned int outSize, const char* in) {
    return record(SpyOnDb().escapes, std::string("backslashes ") + in)
               ? Real(QUORDBEscapeBackslashEX2, "QUORDBEscapeBackslashEX2")(connection, out, outSize, in)
               : -1;
}

void QUORDBClose(DBConnect_tag* connection) {
    ++SpyOnDb().closed;
    Real(QUORDBClose, "QUORDBClose")(connection);
}

#include "tests/support/db_spy.h"

#include "quor/quordb.h"
#include "tests/support/real.h"

namespace quor::test {

DbSpy& SpyOnDb() {
    static DbSpy spy;
    return spy;
}

}  // namespace quor::test

namespace {

// False when the statement is to fail.
bool record(const char* sql, const std::string& window) {
    quor::test::DbSpy& spy = quor::test::SpyOnDb();
    spy.statements.push_back(sql + window);
    return spy.failing.empty() || std::string(sql).find(spy.failing) == std::string::npos;
}

}  // namespace

int QUORDBExecute(DBConnect_tag* connection, const char* sql, DBResult_tag** result) {
    return record(sql, "") ? quor::test::Real(QUORDBExecute, "QUORDBExecute")(connection, sql, result) : -1;
}

int QUORDBSelectLimit(DBConnect_tag* connection, const char* sql, unsigned int count, unsigned int skip,
                      DBResult_tag** result) {
    const bool run = record(sql, " [" + std::to_string(count) + "," + std::to_string(skip) + "]");
    return run ? quor::test::Real(QUORDBSelectLimit, "QUORDBSelectLimit")(connection, sql, count, skip, result) : -1;
}

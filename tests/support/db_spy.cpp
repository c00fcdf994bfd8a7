#include "support/db_spy.h"

#include <dlfcn.h>

#include "quor/quordb.h"

namespace quor::test {

DbSpy& SpyOnDb() {
    static DbSpy spy;
    return spy;
}

}  // namespace quor::test

namespace {

// The library's own definition behind the one of this program.
template <typename Function>
Function* real(Function* /*type*/, const char* name) {
    return reinterpret_cast<Function*>(dlsym(RTLD_NEXT, name));
}

// False when the statement is to fail.
bool record(const char* sql, const std::string& window) {
    quor::test::DbSpy& spy = quor::test::SpyOnDb();
    spy.statements.push_back(sql + window);
    return spy.failing.empty() || std::string(sql).find(spy.failing) == std::string::npos;
}

}  // namespace

int QUORDBExecute(DBConnect_tag* connection, const char* sql, DBResult_tag** result) {
    return record(sql, "") ? real(QUORDBExecute, "QUORDBExecute")(connection, sql, result) : -1;
}

int QUORDBSelectLimit(DBConnect_tag* connection, const char* sql, unsigned int count, unsigned int skip,
                      DBResult_tag** result) {
    const bool run = record(sql, " [" + std::to_string(count) + "," + std::to_string(skip) + "]");
    return run ? real(QUORDBSelectLimit, "QUORDBSelectLimit")(connection, sql, count, skip, result) : -1;
}

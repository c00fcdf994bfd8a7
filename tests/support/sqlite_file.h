// A database seen by SQLite itself, beside the code under test. Throws when a statement fails.
#ifndef TESTS_SUPPORT_SQLITE_FILE_H
#define TESTS_SUPPORT_SQLITE_FILE_H

#include <sqlite3.h>

#include <stdexcept>
#include <string>
#include <vector>

#include "base/guards.h"

namespace quor::test {

class SqliteFile {
  public:
    // Creates the file when it is missing.
    explicit SqliteFile(const std::string& path) {
        const int status = sqlite3_open(path.c_str(), Adopt(db_));
        check(status);
        sqlite3_busy_timeout(db_.get(), 5000);  // programs under test write at the same time
    }

    // Any number of statements.
    void run(const std::string& sql) { check(sqlite3_exec(db_.get(), sql.c_str(), nullptr, nullptr, nullptr)); }

    // Every field of every row, in order; NULL as "NULL".
    std::vector<std::string> query(const std::string& sql) {
        std::vector<std::string> fields;
        check(sqlite3_exec(db_.get(), sql.c_str(), append, &fields, nullptr));
        return fields;
    }

  private:
    static int append(void* fields, int count, char** values, char** /*names*/) {
        for (int i = 0; i < count; ++i) {
            static_cast<std::vector<std::string>*>(fields)->push_back(values[i] != nullptr ? values[i] : "NULL");
        }
        return 0;
    }

    void check(int status) {
        if (status != SQLITE_OK) {
            throw std::runtime_error(sqlite3_errmsg(db_.get()));
        }
    }

    Guard<sqlite3, sqlite3_close> db_;
};

}  // namespace quor::test

#endif

// A fresh folder with one database that the code under test and the test itself open.
#ifndef TESTS_SUPPORT_DATABASE_H
#define TESTS_SUPPORT_DATABASE_H

#include "tests/support/testing.h"

namespace quor::test {

class DatabaseTest : public testing::Test {
  protected:
    DatabaseTest() { TakeSystemLog(); }

    void run(const std::string& sql) const { SqliteFile(path_).run(sql); }
    Strings query(const std::string& sql) const { return SqliteFile(path_).query(sql); }

    const TempFolder folder_;
    std::string path_ = folder_.path("log.db");
};

}  // namespace quor::test

#endif

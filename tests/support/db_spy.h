// The wrapper's statements as the library sends them: recorded, then run for real, or failing on demand.
#ifndef TESTS_SUPPORT_DB_SPY_H
#define TESTS_SUPPORT_DB_SPY_H

#include <string>
#include <vector>

namespace quor::test {

struct DbSpy {
    std::vector<std::string> statements;  // a limited select ends in " [COUNT,SKIP]"
    std::string failing;                  // a statement that contains this fails without being run, when not empty
};

DbSpy& SpyOnDb();

}  // namespace quor::test

#endif

// The wrapper's calls as the library makes them: recorded, then made for real, or failing on demand.
#ifndef TESTS_SUPPORT_DB_SPY_H
#define TESTS_SUPPORT_DB_SPY_H

#include <string>
#include <vector>

namespace quor::test {

struct DbSpy {
    std::vector<std::string> statements;  // a limited select ends in " [COUNT,SKIP]"
    std::vector<std::string> escapes;     // "quotes" and "backslashes"
    std::string failing;                  // a statement or escape that contains this fails unrun, when not empty
    int rowsLeft = -1;                    // from 0 on, the row after so many others cannot be fetched
    int closed = 0;                       // connections, null ones too
};

inline DbSpy& SpyOnDb() {
    static DbSpy spy;
    return spy;
}

}  // namespace quor::test

#endif

// The notification service of the test program: notices are recorded, not delivered, and fail on demand.
#ifndef TESTS_SUPPORT_NOTICES_H
#define TESTS_SUPPORT_NOTICES_H

#include <functional>
#include <map>
#include <string>
#include <vector>

namespace quor::test {

struct Notice {
    std::string tag;
    std::string textsDir;
    std::string filterFile;
    std::map<std::string, std::string> values;  // the placeholders that the library sends, where set
};

struct Notices {
    std::vector<Notice> sent;
    bool fail = false;
    std::function<void()> onSend;  // called for each notice, to look at the world at that moment
};

Notices& FakeNotices();

}  // namespace quor::test

#endif

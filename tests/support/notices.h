// The notification service of the test program: notices are recorded, not delivered, and fail on demand; the settings
// of its channels are what the test says.
#ifndef TESTS_SUPPORT_NOTICES_H
#define TESTS_SUPPORT_NOTICES_H

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "quor/quornotify.h"

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

    QUORMAIL mail{};
    QUORSMSCONF sms{};
    bool mailUnreadable = false;
    bool smsUnreadable = false;
    int smsLent = 0;  // settings that were not given back yet
};

inline Notices& FakeNotices() {
    static Notices notices;
    return notices;
}

}  // namespace quor::test

#endif

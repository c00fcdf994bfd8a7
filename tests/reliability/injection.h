// Hostile values, and a watch over what SQLite is asked to do with them.
#ifndef TESTS_RELIABILITY_INJECTION_H
#define TESTS_RELIABILITY_INJECTION_H

#include <random>
#include <set>

#include "base/numbers.h"
#include "common.h"
#include "quor/quordb.h"
#include "tests/support/testing.h"

namespace quor::test {

// The same values in every run.
class Hostile {
  public:
    size_t number(size_t below) { return random_() % below; }

    // May hold zero bytes.
    std::string value() {
        static const std::list<std::string> pieces = Tokenize(
            "'|''|\"|;|--|/*|*/|[|]|(|)|\\|%|_|`|*|?|x| OR |1=1|%s%n|$(id)>|<b>|\t|\n|\x01|\x1b[|\x7f|\xff|\xc3|"
            "\xef\xbf\xbd|UNION SELECT|DROP TABLE logs|DELETE FROM log",
            "|");
        std::string text;
        for (size_t left = number(8); left > 0; --left) {
            const auto piece = std::next(pieces.begin(), static_cast<long>(number(pieces.size())));
            text += number(30) == 0 ? std::string(1, '\0') : *piece;
        }
        return text;
    }

    // What a command line can carry.
    std::string argument() {
        const std::string text = value();
        return text.substr(0, text.find('\0'));
    }

  private:
    std::mt19937 random_{2024};
};

using Actions = std::set<std::string>;

// What statements did beside reading: "INSERT log", "BEGIN", or SQLite's number of any other action with its object.
inline Actions& Seen() {
    static Actions seen;
    return seen;
}

inline Actions TakeActions() {
    return std::exchange(Seen(), {});
}

inline int Watch(void* /*context*/, int action, const char* object, const char*, const char*, const char*) {
    static const std::map<int, std::string> writing = {
        {SQLITE_INSERT, "INSERT "}, {SQLITE_UPDATE, "UPDATE "}, {SQLITE_DELETE, "DELETE "}, {SQLITE_TRANSACTION, ""}};
    static const std::set<int> reading = {SQLITE_SELECT, SQLITE_READ, SQLITE_FUNCTION, SQLITE_RECURSIVE};
    const auto known = writing.find(action);
    if (reading.count(action) == 0) {
        Seen().insert((known != writing.end() ? known->second : std::to_string(action) + " ") + OrEmpty(object));
    }
    return SQLITE_OK;
}

}  // namespace quor::test

#endif

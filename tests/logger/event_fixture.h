// A fresh folder for event databases, the schema where the library looks for it, and no event database of the package.
#ifndef TESTS_LOGGER_EVENT_FIXTURE_H
#define TESTS_LOGGER_EVENT_FIXTURE_H

#include "logger.h"
#include "support/clock.h"
#include "support/testing.h"

namespace quor::test {

class EventLog : public testing::Test {
  protected:
    EventLog() {
        WriteFile(paths::kEventSchema, ReadFile(SCHEMA_FOLDER "/quorsyslog.sql"));
        std::filesystem::remove_all(own_.substr(0, own_.rfind('/')));
        TakeSystemLog();
    }
    ~EventLog() override { ResetClock(); }

    // "level time user event" of each.
    static Strings stored(const std::string& path) {
        return SqliteFile(path).query(
            "SELECT level || ' ' || time || ' ' || user || ' ' || event FROM log ORDER BY id");
    }

    static std::string lastMessage() {
        const Strings lines = TakeSystemLogTexts();
        return lines.empty() ? "" : lines.back();
    }

    const std::string own_ = paths::kEventDb;
    const TempFolder folder_;
    const std::string path_ = folder_.path("new folder/events.db");
    Logger logger_;
};

}  // namespace quor::test

#endif

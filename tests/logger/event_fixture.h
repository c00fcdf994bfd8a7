// A fresh folder for event databases, the schema where the library looks for it, and no event database of the package.
#ifndef TESTS_LOGGER_EVENT_FIXTURE_H
#define TESTS_LOGGER_EVENT_FIXTURE_H

#include <gtest/gtest.h>

#include "common/paths.h"
#include "logger.h"
#include "support/clock.h"
#include "support/sqlite_file.h"
#include "support/system_log.h"
#include "support/temp_folder.h"

namespace quor::test {

using Strings = std::vector<std::string>;

class EventLog : public testing::Test {
  protected:
    EventLog() {
        namespace fs = std::filesystem;
        const fs::path schema = paths::kEventSchema;
        fs::create_directories(schema.parent_path());
        fs::copy_file(SCHEMA_FOLDER "/quorsyslog.sql", schema, fs::copy_options::overwrite_existing);
        fs::remove_all(own_.substr(0, own_.rfind('/')));
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

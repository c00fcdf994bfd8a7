#include <syslog.h>
#include <unistd.h>

#include "common/handles.h"
#include "common/logplaces.h"
#include "logger.h"
#include "logger/catalogue.h"
#include "logger/eventdb.h"

namespace {

using EventList = std::list<_SSYSLOG_LOG_LOG_tag>;

int readEvents(DBResult_tag* result, void* context) {
    auto& events = *static_cast<EventList*>(context);
    for (quor::Row row(result); QUORDBNumRows(result) >= 1 && row.next();) {
        _SSYSLOG_LOG_LOG_tag event;
        event.id = quor::ToInt32(row["id"]);
        event.level = quor::ToInt32(row["level"]);
        event.time = quor::ToInt64(row["time"]);
        event.user = row["user"];
        event.event = row["event"];
        events.push_back(std::move(event));
    }
    return 0;
}

}  // namespace

std::list<_SSYSLOG_LOG_LOG_tag> Logger::LogEnum(std::string dbPath, int offset, int limit) {
    quor::EventDb db(dbPath);
    if (!db.connect()) {
        return {};
    }
    std::string statement = "SELECT * FROM log ORDER BY time DESC";
    if (limit != 0) {
        statement += " LIMIT " + quor::WrappedDecimal(limit) + " OFFSET " + quor::WrappedDecimal(offset);
    }
    EventList events;
    if (db->DBExecute(statement, readEvents, &events) < 0) {
        Debuger::MSG(0, "Fail to execute SQL command " + statement);
    }
    return events;
}

int Logger::LogClear(std::string dbPath, std::string user) {
    (void)unlink(dbPath.c_str());  // what is recorded next says that it was asked for
    if (LogAddLogClear(dbPath, user) < 0) {
        syslog(LOG_ERR, "%s:%d Fail to add log [%s]", "logger", quor::place::kClearRecord,
               quor::CatalogueRow(quor::Event::LogClear).format);
    }
    return 0;
}

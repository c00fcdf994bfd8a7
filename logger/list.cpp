#include <syslog.h>
#include <unistd.h>

#include "catalogue.h"
#include "common/numbers.h"
#include "eventdb.h"
#include "logger.h"
#include "quor/quordb.h"

namespace {

using EventList = std::list<_SSYSLOG_LOG_LOG_tag>;

const char* field(DBResult_tag* result, unsigned int row, const char* column) {
    return quor::OrEmpty(QUORDBFetchField(result, row, column));
}

int readEvents(DBResult_tag* result, void* context) {
    auto& events = *static_cast<EventList*>(context);
    unsigned int row = 0;
    while (QUORDBNumRows(result) >= 1 && QUORDBFetchRow(result, &row) >= 0) {
        _SSYSLOG_LOG_LOG_tag event;
        event.id = quor::ToInt32(field(result, row, "id"));
        event.level = quor::ToInt32(field(result, row, "level"));
        event.time = quor::ToInt64(field(result, row, "time"));
        event.user = field(result, row, "user");
        event.event = field(result, row, "event");
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
        statement += " LIMIT " + quor::WidenedDecimal(limit) + " OFFSET " + quor::WidenedDecimal(offset);
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
        syslog(LOG_ERR, "%s:%d Fail to add log [%s]", "logger", __LINE__,
               quor::CatalogueRow(quor::Event::LogClear).format);
    }
    return 0;
}

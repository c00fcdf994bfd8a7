#include <sqlite3.h>
#include <sys/stat.h>

#include <algorithm>
#include <new>

#include "accounting/deviceindex.h"
#include "base/guards.h"
#include "base/numbers.h"
#include "base/paths.h"
#include "common.h"
#include "dbhandler/session.h"

namespace {

using Samples = std::list<SYSLOG_LOG_EPS>;
using Histogram = std::list<QUORLOG_LOG_DEVICE_STATISTIC>;
using SqlText = quor::Guard<char, sqlite3_free>;

constexpr off_t kPurgeAboveBytes = off_t{5} * 1024 * 1024;
constexpr const char* kPurge = "DELETE FROM eps WHERE stamp < strftime('%s', 'now') - 24*60*60;";

// Ends the transaction in every case, also one that was rolled back or never began (which is reported).
class EndOfTransaction {
  public:
    explicit EndOfTransaction(DBHandler& db) : db_(db) {}
    EndOfTransaction(const EndOfTransaction&) = delete;
    EndOfTransaction& operator=(const EndOfTransaction&) = delete;
    ~EndOfTransaction() {
        try {
            (void)db_.DBTranEnd();
        } catch (const std::bad_alloc&) {
            return;  // there was no memory left to report that it failed
        }
    }

  private:
    DBHandler& db_;
};

template <typename... Texts>
std::string toSql(const char* format, const Texts&... texts) {
    const SqlText sql(sqlite3_mprintf(format, texts.c_str()...));
    return quor::OrEmpty(sql.get());
}

void reportStatement(const std::string& sql) {
    Debuger::MSG(0, "Fail to execute SQL command: " + sql);
}

bool writeSample(DBHandler& db, const SYSLOG_LOG_EPS& sample) {
    const std::string stamp = quor::WrappedDecimal(sample.stamp);
    for (const auto& [device, count] : sample.devices) {
        const std::string logs = quor::WrappedDecimal(count);
        const std::string sql = toSql("INSERT INTO eps VALUES(NULL, '%q', '%q', '%q');", stamp, device, logs);
        if (db.DBExecute(sql) < 0) {
            reportStatement(sql);
            return false;
        }
    }
    return true;
}

// Samples written before one that fails stay: only the histogram's failure undoes them.
bool writeSamples(DBHandler& db, const Samples& samples) {
    return std::all_of(samples.begin(), samples.end(),
                       [&db](const SYSLOG_LOG_EPS& sample) { return writeSample(db, sample); });
}

bool writeHistogram(DBHandler& db, const Histogram& histogram) {
    for (const QUORLOG_LOG_DEVICE_STATISTIC& row : histogram) {
        const std::string sql =
            toSql("INSERT OR REPLACE INTO histogram VALUES(NULL, '%q', %q);", row.device, ullNumberToString(row.count));
        if (db.DBExecute(sql) < 0) {
            (void)db.DBTranRollback();
            reportStatement(sql);
            return false;
        }
    }
    return true;
}

// Keeps the file from growing without end. False when it is no regular file; a failed purge is only reported.
bool purge(DBHandler& db, const std::string& path) {
    struct stat status {};
    if (stat(path.c_str(), &status) != 0) {
        Debuger::MSG(0, "Fail to state file status: " + path);
        return false;
    }
    if (!S_ISREG(status.st_mode)) {
        Debuger::MSG(0, "Working database is not regular file");
        return false;
    }
    if (status.st_size > kPurgeAboveBytes && db.DBExecute(kPurge) < 0) {
        reportStatement(kPurge);
    }
    return true;
}

}  // namespace

int AccountingManager::AccoutingFlush2DB() {
    if (epsList_.empty()) {
        return 0;
    }
    quor::DbSession session(dbPath_, quor::paths::kAccountingSchema);
    DBHandler& db = session.handler();
    const EndOfTransaction end(db);
    if (!session.connect()) {
        return -1;
    }
    (void)db.DBTranStart();  // reports its own failure; the statements then stand alone
    if (!writeSamples(db, epsList_) || !writeHistogram(db, histogram_) || !purge(db, dbPath_)) {
        return -1;
    }
    epsList_.clear();
    return 0;
}

unsigned long long AccountingManager::EpsListTrim(unsigned long long maxCounts) {
    auto oldestKept = epsList_.end();
    for (unsigned long long counts = 0; oldestKept != epsList_.begin(); --oldestKept) {
        counts += std::prev(oldestKept)->devices.size();
        if (counts > maxCounts) {
            break;
        }
    }
    const auto forgotten = static_cast<unsigned long long>(std::distance(epsList_.begin(), oldestKept));
    epsList_.erase(epsList_.begin(), oldestKept);
    return forgotten;
}

#include <sqlite3.h>
#include <sys/stat.h>

#include <algorithm>
#include <map>
#include <new>
#include <vector>

#include "accounting/deviceindex.h"
#include "base/numbers.h"
#include "base/paths.h"
#include "common.h"
#include "common/handles.h"
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

namespace {

constexpr long long kOverlap = 5;  // seconds

using Deltas = std::map<std::string, uint64_t>;

Deltas countsOf(const Samples& samples) {
    Deltas counts;
    for (const SYSLOG_LOG_EPS& sample : samples) {
        for (const auto& [device, count] : sample.devices) {
            counts[device] += static_cast<uint64_t>(count);
        }
    }
    return counts;
}

bool executeAll(DBHandler& db, const std::string& sql) {
    if (db.DBExecute(sql) < 0) {
        reportStatement(sql);
        return false;
    }
    return true;
}

// Adds to what is there instead of replacing it: whatever was read at the start, or by whom it was changed since, no
// count is lost.
bool addCounts(DBHandler& db, const Deltas& counts) {
    return std::all_of(counts.begin(), counts.end(), [&db](const auto& entry) {
        return executeAll(db, toSql("INSERT INTO histogram VALUES(NULL, '%q', %q) "
                                    "ON CONFLICT(device) DO UPDATE SET count = count + excluded.count;",
                                    entry.first, quor::Decimal(entry.second)));
    });
}

struct Positions {
    const std::string& source;
    uint64_t last;
    uint64_t judged;
};

bool writePositions(DBHandler& db, const Positions& at) {
    return executeAll(db, toSql("INSERT INTO followed VALUES('%q', %q, %q) ON CONFLICT(source) DO UPDATE SET "
                                "last = max(last, excluded.last), judged = max(judged, excluded.judged);",
                                at.source, quor::Decimal(at.last), quor::Decimal(at.judged)));
}

int readPositions(DBResult_tag* result, void* context) {
    quor::Row row(result);
    auto& found = *static_cast<std::vector<uint64_t>*>(context);
    if (row.next()) {
        found = {quor::ToUint64(row["last"]), quor::ToUint64(row["judged"])};
    }
    return 0;
}

}  // namespace

int AccountingManager::RowInc(const std::string& device, long long second, unsigned long long id) {
    const bool overlaps = second < rowSecond_ && rowSecond_ - second <= kOverlap;
    const long long now = overlaps ? rowSecond_ : second;  // else the clock was set back
    if (now != rowSecond_) {
        CloseRows();
    }
    followsRows_ = true;
    rowSecond_ = now;
    lastRow_ = id;
    ++totalCount_;
    Count(device);
    return 0;
}

void AccountingManager::CloseRows() {
    if (curEps_ != 0) {
        CloseSample(rowSecond_);
    }
    closedRow_ = lastRow_;
}

int AccountingManager::RowsUpdate(long long now) {
    if (now > rowSecond_ || rowSecond_ - now > kOverlap) {
        CloseRows();
    }
    return 0;
}

unsigned long long AccountingManager::RowsWaiting() {
    unsigned long long counts = 0;
    for (const SYSLOG_LOG_EPS& sample : epsList_) {
        counts += sample.devices.size();
    }
    return counts;
}

int AccountingManager::RowsFlush2DB(const std::string& source, unsigned long long judged) {
    if (epsList_.empty() && judged == judgedRow_) {
        return 0;
    }
    quor::DbSession session(dbPath_, quor::paths::kAccountingSchema);
    DBHandler& db = session.handler();
    if (!session.connect() || db.DBTranStart() < 0) {
        return -1;
    }
    const bool written = writeSamples(db, epsList_) && addCounts(db, countsOf(epsList_)) &&
                         writePositions(db, {source, closedRow_, judged}) && db.DBTranEnd() == 0;
    if (!written) {
        (void)db.DBTranRollback();  // closing the connection does the same
        return -1;
    }
    judgedRow_ = judged;
    epsList_.clear();
    (void)purge(db, dbPath_);  // reports its own failure; everything is written
    return 0;
}

int AccountingManager::RowsPositionGet(const std::string& source, unsigned long long& last,
                                       unsigned long long& judged) {
    quor::DbSession session(dbPath_, quor::paths::kAccountingSchema);
    std::vector<uint64_t> found;
    if (!session.connect() || session->DBExecute(toSql("SELECT last, judged FROM followed WHERE source = '%q'", source),
                                                 readPositions, &found) < 0) {
        return -1;
    }
    if (found.empty()) {
        return 0;
    }
    last = found[0];
    judged = found[1];
    return 1;
}

void AccountingManager::RowsPositionSet(unsigned long long last) {
    followsRows_ = true;
    lastRow_ = closedRow_ = last;
    judgedRow_ = 0;
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

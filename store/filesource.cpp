// One log database, read through the library.
#include <fcntl.h>
#include <sys/stat.h>

#include "store/ask.h"
#include "store/databasefile.h"
#include "store/failure.h"
#include "store/source.h"

namespace quor::store {
namespace {

using Record = _SYSLOG_LOG_DATA_tag;

// Without a filter the library pages by ids and counts the largest id: exact only while no row was deleted. A condition
// that every row meets makes both exact.
Conditions exact(const Conditions& conditions) {
    return conditions.empty() ? Conditions{IdCondition(SYSLOG_OP_AT_LEAST, 0)} : conditions;
}

class FileSource : public Source {
  public:
    explicit FileSource(std::string path) : path_(std::move(path)) {}

    uint64_t read(const std::string& table, const Conditions& conditions, const Window& window, bool ascending,
                  const RecordHandler& handler) const override {
        struct Walk {
            const RecordHandler& handler;
            uint64_t rows = 0;
        } walk{handler};
        const auto visit = [](Record& record, void* context) {
            auto& current = *static_cast<Walk*>(context);
            ++current.rows;
            current.handler(record);
            return 0;
        };
        std::string db = path_;
        std::string name = table;
        Conditions wanted = exact(conditions);
        _SYSLOG_SQL_LIMIT_tag limit{window.limit, window.offset};
        _SYSLOG_SQL_ORDER_tag order{ascending ? 1 : 0, SYSLOG_ATTRI_ID};
        if (SyslogDBSelectByTable(db, name, wanted, &limit, &order, visit, &walk, false) < 0) {
            fail(table, wanted);
        }
        return walk.rows;
    }

    uint64_t count(const std::string& table, const Conditions& conditions) const override {
        std::string db = path_;
        std::string name = table;
        Conditions wanted = exact(conditions);
        const int rows = SyslogDBSelectCountByTable(db, name, wanted, nullptr, nullptr);
        if (rows < 0) {
            fail(table, wanted);
        }
        return static_cast<uint64_t>(rows);
    }

    std::list<std::string> values(_SYSLOG_DB_ATTRI_tag attribute, const Window& window) const override {
        std::string db = path_;
        std::string column = LogAttriStrGet(attribute);
        _SYSLOG_SQL_LIMIT_tag limit{window.limit, window.offset};
        std::list<std::string> found;
        if (SyslogDBAttriValueGet(db, column, &limit, found) < 0) {
            (void)Ask(path_, "SELECT " + column + " FROM logs LIMIT 1", column.c_str());
            throw Failure("cannot read the values from " + path_ + "; try again", Cause::Other);
        }
        return found;
    }

    void remove(const Conditions& conditions) const override {
        std::string db = path_;
        Conditions doomed = conditions;
        if (SyslogDBDelete(db, doomed) < 0) {
            (void)Ask(path_, "DELETE FROM logs WHERE 0", "");
            throw Failure("cannot delete from " + path_ + "; see the system log", Cause::Other);
        }
    }

    // The number of a removed file is soon given to another one; the time when it was made tells them apart.
    uint64_t identity() const override {
        struct statx status = {};
        if (statx(AT_FDCWD, path_.c_str(), 0, STATX_INO | STATX_BTIME, &status) != 0) {
            return 0;
        }
        constexpr uint64_t kSpread = 1000000007;
        const auto seconds = static_cast<uint64_t>(status.stx_btime.tv_sec);
        return (status.stx_ino * kSpread + seconds) * kSpread + status.stx_btime.tv_nsec;
    }

    const std::string& name() const override { return path_; }

  private:
    // The library does not say why it failed; the same question, asked again, does.
    [[noreturn]] void fail(const std::string& table, Conditions conditions) const {
        std::string where;
        (void)SqlCondListToStr(conditions, where);  // it has rendered before
        (void)Ask(path_, "SELECT 1 FROM " + table + " WHERE " + where + " LIMIT 1", "1");
        throw Failure(path_ + ": the query failed; see the system log", Cause::Other);
    }

    std::string path_;
};

}  // namespace

std::unique_ptr<Source> OpenSource(const std::string& path) {
    return std::make_unique<FileSource>(RequireLogDatabase(path));
}

}  // namespace quor::store

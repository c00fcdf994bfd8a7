// One log database, read through the library.
#include <fcntl.h>
#include <sys/stat.h>

#include <set>

#include "store/ask.h"
#include "store/columns.h"
#include "store/databasefile.h"
#include "store/failure.h"
#include "store/regex.h"
#include "store/shape.h"
#include "store/source.h"

namespace quor::store {
namespace {

const std::string kNoIdentity = "file ";

std::string pattern(const std::string& text) {
    const _SYSLOG_SQL_COND_tag value{SYSLOG_ATTRI_HOST, SYSLOG_OP_GLOB, text, {}};
    return "'" + CondValueEscape(&value) + "'";
}

// "column IN ('a', 'b') OR column GLOB 'c*'"
std::string renderedList(const std::string& column, const std::list<std::string>& values, bool patternsToo) {
    std::string names;
    std::string patterns;
    for (const std::string& value : values) {
        if (!patternsToo || value.find_first_of("*?") == std::string::npos) {
            names += (names.empty() ? "" : ", ") + Literal(value);
        } else {
            patterns += " OR " + column + " GLOB " + pattern(value);
        }
    }
    return column + " IN (" + names + ")" + patterns;
}

std::string rendered(const ColumnCondition& condition) {
    const std::string column = condition.column;
    const auto first = [&] { return Literal(condition.values.front()); };
    const auto both = [&] { return " (" + first() + ", " + Literal(condition.values.back()) + ")"; };
    switch (condition.match) {
    case Match::Part:
        return "instr(" + column + ", " + first() + ")";
    case Match::PartNoCase:
        return "instr(lower(" + column + "), lower(" + first() + "))";
    case Match::Regex:
        return column + " REGEXP " + first();
    case Match::AtLeast:
        return column + " >=" + both();
    case Match::AtMost:
        return column + " <=" + both();
    default:
        return renderedList(column, condition.values, condition.match == Match::Like);
    }
}

std::string where(Conditions conditions) {
    std::string text;
    (void)SqlCondListToStr(conditions.attributes, text);  // cannot fail
    for (const ColumnCondition& condition : conditions.columns) {
        text += (text.empty() ? "(" : " AND (") + rendered(condition) + (condition.negated ? ") IS NOT TRUE" : ")");
    }
    return text.empty() ? text : " WHERE " + text;
}

// Of the columns that later versions added to a table of logs, those that it lacks, separated by commas; empty when it
// has them, or is no table of ours.
std::string missingColumns(const Connection& connection, const std::string& db, const std::string& table) {
    const Result result = Execute(connection, db, "SELECT name FROM pragma_table_xinfo(" + Literal(table) + ")");
    std::set<std::string> wanted = {"llevel"};
    for (const Column& column : ColumnsOf(table, false)) {
        wanted.insert(column.name);
    }
    for (Row row(result.get()); row.next();) {
        wanted.erase(row["name"]);
    }
    std::string missing;
    for (const char* added : {"llevel", "pid", "msgid", "sdata", "rsec"}) {
        missing += wanted.erase(added) == 0 ? "" : (missing.empty() ? "" : ", ") + std::string(added);
    }
    return wanted.empty() ? missing : "";
}

void addExtras(const Row& row, Record& record) {
    record.pid = row["pid"];
    record.msgid = row["msgid"];
    record.sdata = row["sdata"];
    record.rsec = ToInt64(row["rsec"]);
}

class FileSource : public Source {
  public:
    explicit FileSource(std::string path) : path_(std::move(path)) {}

    uint64_t read(const std::string& table, const Conditions& conditions, const Window& window, bool ascending,
                  const RecordHandler& handler) const override {
        const std::string sql =
            "SELECT * FROM " + table + where(conditions) + " ORDER BY id " + (ascending ? "asc" : "desc");
        const _SYSLOG_SQL_LIMIT_tag limit{window.limit, window.offset};
        const Result result = ask(table, sql, &limit);
        std::string name = table;
        Record record;
        Row row(result.get());
        uint64_t rows = 0;
        for (; row.next() && DBRecToLogInfo(name, result.get(), row.number(), &record, false) == 0; ++rows) {
            addExtras(row, record);
            handler(record);
        }
        return rows;
    }

    uint64_t count(const std::string& table, const Conditions& conditions) const override {
        const Result result = ask(table, "SELECT COUNT(*) AS rows FROM " + table + where(conditions));
        return ToUint64(Row(result.get())["rows"]);
    }

    void groups(const std::string& table, const Conditions& conditions, const std::string& expression,
                const GroupHandler& handler) const override {
        const Result result = ask(table, "SELECT " + expression + " AS name, COUNT(*) AS rows FROM " + table +
                                             where(conditions) + " GROUP BY 1");
        for (Row row(result.get()); row.next();) {
            handler(row["name"], ToUint64(row["rows"]));
        }
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
        if (!conditions.columns.empty()) {
            (void)ask("logs", "DELETE FROM logs" + where(conditions));
            return;
        }
        std::string db = path_;
        Conditions doomed = conditions;
        if (SyslogDBDelete(db, doomed.attributes) < 0) {
            (void)Ask(path_, "DELETE FROM logs WHERE 0", "");
            throw Failure("cannot delete from " + path_ + "; see the system log", Cause::Other);
        }
    }

    std::vector<IdRange> brought(uint64_t after) const override try {
        const Connection connection = Connect(path_);
        const Result result =
            Execute(connection, path_,
                    "SELECT first, last FROM store_merged WHERE last > " + Decimal(after) + " ORDER BY first");
        std::vector<IdRange> ranges;
        for (Row row(result.get()); row.next();) {
            ranges.push_back({ToUint64(row["first"]), ToUint64(row["last"])});
        }
        return ranges;
    } catch (const Failure& failure) {
        if (failure.cause() != Cause::Missing) {
            throw;
        }
        return {};  // only a database that rows were put into has the table
    }

    // A database says who it is. One that does not is known by the number of its file and the time when that was made.
    std::string identity() const override {
        struct statx status = {};
        if (statx(AT_FDCWD, path_.c_str(), 0, STATX_INO | STATX_BTIME, &status) != 0) {
            return "";
        }
        const std::vector<std::string> value = identities();
        return value.empty()
                   ? kNoIdentity + std::to_string(status.stx_ino) + ":" + std::to_string(status.stx_btime.tv_sec) +
                         "." + std::to_string(status.stx_btime.tv_nsec)
                   : value.front();
    }

    const std::string& name() const override { return path_; }

  private:
    Result ask(const std::string& table, const std::string& sql, const _SYSLOG_SQL_LIMIT_tag* limit = nullptr) const {
        const Connection connection = Connect(path_);
        AddRegexp(connection);
        AddShape(connection);
        try {
            return Execute(connection, path_, sql, limit);
        } catch (const Failure& failure) {
            const std::string missing =
                failure.cause() == Cause::Missing ? missingColumns(connection, path_, table) : "";
            if (missing.empty()) {
                throw;
            }
            throw Failure(path_ + ": table " + table + " is of a former version and lacks " + missing +
                              "; start syslog-ng, which adds them to its database, or leave out what asks for them",
                          Cause::Missing);
        }
    }

    std::vector<std::string> identities() const try {
        return Ask(path_, "SELECT value FROM store_identity", "value");
    } catch (const Failure& failure) {
        if (failure.cause() != Cause::Missing) {
            throw;
        }
        return {};
    }

    std::string path_;
};

}  // namespace

bool HasIdentity(const std::string& identity) {
    return identity.rfind(kNoIdentity, 0) != 0;
}

// As the writer of the database does.
void GiveIdentity(const std::string& path) {
    RequireTable(path, "logs");  // before there is one, the writer still has to choose the size of its pages
    for (const char* sql : {"CREATE TABLE IF NOT EXISTS store_identity (id INTEGER PRIMARY KEY CHECK (id = 1), value "
                            "TEXT NOT NULL)",
                            "INSERT OR IGNORE INTO store_identity VALUES (1, lower(hex(randomblob(16))))"}) {
        (void)Ask(path, sql, "");
    }
}

std::unique_ptr<Source> OpenSource(const std::string& path) {
    return std::make_unique<FileSource>(RequireLogDatabase(path));
}

std::unique_ptr<Source> ExpectSource(const std::string& path) {
    return std::make_unique<FileSource>(AbsolutePath(path));
}

}  // namespace quor::store

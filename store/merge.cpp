#include "store/merge.h"

#include <unistd.h>

#include <algorithm>
#include <chrono>

#include "store/ask.h"
#include "store/failure.h"

namespace quor::store {
namespace {

using Clock = std::chrono::steady_clock;
using Milliseconds = std::chrono::milliseconds;

const std::string kAdvice = "; give a log database";

std::string quoted(const std::string& name) {
    std::string text = "\"";
    for (const char letter : name) {
        text += letter == '"' ? "\"\"" : std::string(1, letter);
    }
    return text + "\"";
}

std::string listOf(const std::vector<StoredColumn>& columns, bool types) {
    std::string list;
    for (const StoredColumn& column : columns) {
        list += (list.empty() ? "" : ", ") + column.name + (types ? " " + column.type : "");
    }
    return list;
}

bool contains(const std::vector<StoredColumn>& columns, const std::string& name) {
    return std::any_of(columns.begin(), columns.end(),
                       [&name](const StoredColumn& column) { return column.name == name; });
}

[[noreturn]] void failWithout(const std::string& db, const std::string& column) {
    throw Failure("the logs of " + db + " have no column " + column + kAdvice, Cause::Missing);
}

[[noreturn]] void failWith(const std::string& from, const std::string& column, const std::string& into) {
    throw Failure("the logs of " + from + " have a column " + column + " that " + into +
                  " lacks; start syslog-ng once with the present configuration, or merge into a database that has it");
}

void requireColumns(const std::string& db, const std::vector<StoredColumn>& columns) {
    for (const char* name : {"\"ldate\"", "\"ltime\"", "\"host\"", "\"msg\""}) {
        if (!contains(columns, name)) {
            failWithout(db, name);
        }
    }
}

// The columns of `from`, all of which `into` must have: nothing is dropped without a word.
std::vector<StoredColumn> sharedColumns(const std::string& from, const std::string& into) {
    const std::vector<StoredColumn> target = StoredColumns(into);
    const std::vector<StoredColumn> given = StoredColumns(from);
    requireColumns(from, given);
    requireColumns(into, target);
    for (const StoredColumn& column : given) {
        if (!contains(target, column.name)) {
            failWith(from, column.name, into);
        }
    }
    std::vector<StoredColumn> shared;
    std::copy_if(target.begin(), target.end(), std::back_inserter(shared),
                 [&given](const StoredColumn& column) { return contains(given, column.name); });
    return shared;
}

// Both databases on one connection: `into` as main, `from` as other.
class Pair {
  public:
    Pair(const std::string& from, const std::string& into) : into_(into), connection_(Connect(into)) {
        run("PRAGMA trusted_schema = OFF");
        run("ATTACH " + Literal(from) + " AS other");
    }

    void run(const std::string& sql) const { (void)Execute(connection_, into_, sql); }
    uint64_t number(const std::string& expression) const {
        const Result result = Execute(connection_, into_, "SELECT (SELECT " + expression + ") AS number");
        Row row(result.get());
        return row.next() ? ToUint64(row["number"]) : 0;
    }
    // Others may take turns for longer than one statement waits.
    void begin() const {
        constexpr int kPatience = 20;
        for (int tried = 1;; ++tried) {
            try {
                return run("BEGIN IMMEDIATE");
            } catch (const Failure& failure) {
                if (failure.cause() != Cause::Busy || tried == kPatience) {
                    throw;
                }
            }
        }
    }

  private:
    const std::string& into_;
    Connection connection_;
};

// Rows are compared in parts, each a span of time, so that equal rows are in the same part and neither memory nor
// temporary files grow with the databases.
class Merger {
  public:
    Merger(const std::string& from, const std::string& into, const std::vector<StoredColumn>& columns)
        : pair_(from, into), columns_(listOf(columns, false)), typed_(listOf(columns, true)) {}

    Merged run(const MergeProgress& progress) {
        known_ = pair_.number("ifnull(max(id), 0) FROM main.logs");
        pair_.run("CREATE TABLE IF NOT EXISTS main.store_merged (first INTEGER PRIMARY KEY, last INTEGER NOT NULL)");
        split();
        const uint64_t parts = pair_.number("count(*) FROM parts");
        for (uint64_t part = 1; part <= parts; ++part) {
            progress(part, parts);
            compare(part);
            add();
        }
        return merged_;
    }

  private:
    static constexpr const char* kTime = "ifnull(ldate, '') || ' ' || ifnull(ltime, '')";

    void split() const {
        pair_.run(std::string("CREATE TEMP TABLE parts AS SELECT min(at) AS first FROM (SELECT at, sum(bytes) OVER "
                              "(ORDER BY at ROWS UNBOUNDED PRECEDING) / 67108864 AS part FROM (SELECT ") +
                  kTime + " AS at, ifnull(length(msg), 0) + 200 AS bytes FROM other.logs)) GROUP BY part ORDER BY 1");
    }

    std::string within(uint64_t part) const {
        const auto first = [](uint64_t number) {
            return "(SELECT first FROM parts WHERE rowid = " + Decimal(number) + ")";
        };
        return std::string(kTime) + " >= " + first(part) + " AND ifnull(" + kTime + " < " + first(part + 1) + ", 1)";
    }

    // Of equal rows those of `into` come first. The nth row of `from` is missing when `into` has fewer than n.
    void compare(uint64_t part) {
        pair_.run("DROP TABLE IF EXISTS temp.piece");
        pair_.run("DROP TABLE IF EXISTS temp.missing");
        pair_.run("CREATE TEMP TABLE piece (quor_new INTEGER, quor_id INTEGER, " + typed_ + ")");
        pair_.run("INSERT INTO piece SELECT 1, id, " + columns_ + " FROM other.logs WHERE " + within(part));
        const uint64_t given = pair_.number("count(*) FROM piece");
        pair_.run("INSERT INTO piece SELECT 0, id, " + columns_ + " FROM main.logs WHERE id <= " + Decimal(known_) +
                  " AND " + within(part));
        pair_.run("CREATE TEMP TABLE missing AS SELECT quor_row FROM (SELECT rowid AS quor_row, quor_new, quor_id, "
                  "ldate, ltime, row_number() OVER w AS quor_nth, sum(1 - quor_new) OVER w AS quor_there FROM piece "
                  "WINDOW w AS (PARTITION BY " +
                  columns_ +
                  " ORDER BY quor_new, quor_id)) WHERE quor_new AND quor_nth > 2 * quor_there "
                  "ORDER BY ldate, ltime, quor_id");
        missing_ = pair_.number("count(*) FROM missing");
        merged_.there += given - missing_;
    }

    // Each write is as small as this machine needs it to be for others not to wait.
    void add() {
        constexpr Milliseconds kShort{25};
        constexpr Milliseconds kLong{100};
        constexpr Milliseconds kPause{200};
        for (uint64_t done = 0; done < missing_;) {
            const uint64_t rows = std::min(step_, missing_ - done);
            pair_.begin();
            const auto start = Clock::now();
            addRows(done + 1, done + rows);
            const auto taken = std::chrono::duration_cast<Milliseconds>(Clock::now() - start);
            done += rows;
            merged_.added += rows;
            step_ = taken > kLong ? std::max<uint64_t>(step_ / 2, 1) : taken < kShort ? step_ + step_ / 2 + 1 : step_;
            (void)usleep(static_cast<useconds_t>(std::min(taken, kPause).count() * 1000 + 1000));
        }
    }

    void addRows(uint64_t first, uint64_t last) const {
        pair_.run("INSERT INTO main.logs (" + columns_ + ") SELECT " + columns_ +
                  " FROM missing CROSS JOIN piece ON piece.rowid = missing.quor_row WHERE missing.rowid BETWEEN " +
                  Decimal(first) + " AND " + Decimal(last) + " ORDER BY missing.rowid");
        pair_.run("INSERT INTO main.store_merged SELECT max(id) - " + Decimal(last - first) +
                  ", max(id) FROM main.logs");
        pair_.run("COMMIT");
    }

    Pair pair_;
    std::string columns_;
    std::string typed_;
    uint64_t known_ = 0;  // rows above came meanwhile
    uint64_t missing_ = 0;
    uint64_t step_ = 200;
    Merged merged_;
};

}  // namespace

std::vector<StoredColumn> StoredColumns(const std::string& db) {
    const Connection connection = Connect(db);
    const Result result =
        Execute(connection, db, "SELECT name, type FROM pragma_table_xinfo('logs') WHERE hidden = 0 AND name <> 'id'");
    std::vector<StoredColumn> columns;
    for (Row row(result.get()); row.next();) {
        columns.push_back({quoted(row["name"]), row["type"]});
    }
    return columns;
}

void RequireSoundLogs(const std::string& db) {
    if (Ask(db, "PRAGMA quick_check(1)", "quick_check") != std::vector<std::string>{"ok"}) {
        throw Failure(db + " is damaged; save its rows with quorlog db salvage, and take what that makes",
                      Cause::Damaged);
    }
    const char* const kKinds = "SELECT count(CASE WHEN name = 'logs' AND type = 'table' AND rootpage > 0 THEN 1 END) "
                               "|| ' ' || count(CASE WHEN type = 'trigger' THEN 1 END) AS kinds FROM sqlite_schema";
    if (Ask(db, kKinds, "kinds") != std::vector<std::string>{"1 0"}) {
        throw Failure(db + " has no plain table logs, or has triggers" + kAdvice + " or a backup of one",
                      Cause::Missing);
    }
    (void)Ask(db, "SELECT id FROM logs LIMIT 1", "id");
}

void RequireWritableLogs(const std::string& db) {
    const Connection connection = Connect(db);
    (void)Execute(connection, db, "BEGIN");
    try {
        requireColumns(db, StoredColumns(db));
        (void)Execute(connection, db,
                      "INSERT INTO logs (ldate, ltime, host, msg) VALUES ('', '', '', ''), ('', '', '', '')");
    } catch (const Failure& failure) {
        throw Failure("syslog-ng could not write to the logs of that database" + kAdvice + " or a backup of one",
                      failure.cause());
    }
    (void)Execute(connection, db, "ROLLBACK");
}

Merged MergeRows(const std::string& from, const std::string& into, const MergeProgress& progress) {
    RequireSoundLogs(from);
    RequireTable(into, "logs");
    return Merger(from, into, sharedColumns(from, into)).run(progress);
}

uint64_t AppendRows(const std::string& from, uint64_t after, const std::string& into) {
    const Pair pair(from, into);
    const std::string columns = listOf(sharedColumns(from, into), false);
    const uint64_t rows = pair.number("count(*) FROM other.logs WHERE id > " + Decimal(after));
    if (rows != 0) {
        pair.begin();
        pair.run("INSERT INTO main.logs (" + columns + ") SELECT " + columns + " FROM other.logs WHERE id > " +
                 Decimal(after) + " ORDER BY id");
        pair.run("COMMIT");
    }
    return rows;
}

}  // namespace quor::store

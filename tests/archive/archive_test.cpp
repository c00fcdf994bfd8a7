// An archive answers as the database that it was made of. QUOR_ARCHIVE_FILTERS=100000 tries so many random searches.
#include <algorithm>
#include <cstdlib>
#include <random>

#include "dbhandler.h"
#include "dbutil.h"
#include "platform/include/quor/quorarchive.h"
#include "quor/quordb.h"
#include "tests/support/database.h"

using namespace quor::test;

namespace {

using Conditions = std::list<_SYSLOG_SQL_COND_tag>;

// Values as nobody expects them, the same in every run.
class Dice {
  public:
    size_t below(size_t count) { return random_() % count; }
    template <size_t N>
    std::string of(const char* const (&texts)[N]) {
        return texts[below(N)];
    }
    // A literal for any column.
    std::string value(const std::string& usual) {
        static const char* const kOdd[] = {"NULL",
                                           "''",
                                           "5",
                                           "2.5",
                                           "x'00ff27'",
                                           "CAST(x'c3280041e9' AS TEXT)",
                                           "'quote '' and % and _ and [x]'",
                                           "CAST(x'61006200' AS TEXT)"};
        return below(12) == 0 ? of(kOdd) : usual;
    }

  private:
    std::mt19937 random_{7};
};

constexpr const char* kHosts[] = {"core", "Core", "mail-gate", "web 01", "a,b", "", "\xc3\xa9t\xc3\xa9"};
constexpr const char* kPrograms[] = {"sshd", "kernel", "CRON", "x*y"};
constexpr const char* kLevels[] = {"err", "info", "debug", "emerg"};
constexpr const char* kWords[] = {"Failed password", "failed",  "%BGP_5",         "[UFW BLOCK]",
                                  "a*b?c",           "link up", "\xe2\x82\xac 5", "zz"};

std::string text(const std::string& value) {
    return "'" + value + "'";
}

std::string row(Dice& dice, int id) {
    const std::string day = "2024-01-" + std::string(id < 9000 ? "0" : "1") + std::to_string(id / 1000 % 9 + 1);
    std::string message = dice.of(kWords) + " " + std::to_string(dice.below(100000)) + " from " + dice.of(kHosts);
    message += dice.below(900) == 0 ? std::string(65536, 'm') : "";
    const std::string cells[] = {std::to_string(id),
                                 dice.value(text(message)),
                                 dice.value(text(dice.of(kLevels))),
                                 text(day),
                                 dice.value(text(dice.of(kHosts))),
                                 dice.value(text(dice.of(kPrograms))),
                                 text("kern"),
                                 text("10:" + std::to_string(10 + dice.below(50))),
                                 dice.value("'10.0.0.1'"),
                                 dice.value(std::to_string(1700000000 + id)),
                                 dice.value(text(std::to_string(dice.below(5000)))),
                                 dice.value("''"),
                                 std::to_string(1700000000 + id)};
    std::string joined;
    for (const std::string& cell : cells) {
        joined += (joined.empty() ? "(" : ", ") + cell;
    }
    return joined + ")";
}

// The answer to a statement, types and all.
Strings answer(const std::string& path, const std::string& sql) {
    DBConnect_tag* connection = QUORDBConnect(nullptr, nullptr, nullptr, path.c_str());
    DBResult_tag* result = nullptr;
    Strings fields;
    if (QUORDBExecute(connection, sql.c_str(), &result) < 0) {
        fields.push_back(std::string("error: ") + QUORDBErrorGet(connection));
    }
    for (unsigned int number = 0; QUORDBFetchRow(result, &number) >= 0;) {
        const char* field = QUORDBFetchField(result, number, "a");
        fields.emplace_back(field != nullptr ? field : "NULL");
    }
    QUORDBFreeResult(result);
    QUORDBClose(connection);
    return fields;
}

constexpr const char kAll[] =
    "SELECT id || quote(msg) || quote(prio) || quote(llevel) || quote(ldate) || quote(host) || quote(prog) || "
    "quote(fac) ||"
    " quote(ltime) || quote(ip) || quote(tag) || quote(utcsec) || quote(tzoffset) || quote(pid) || quote(msgid) ||"
    " quote(sdata) || quote(rsec) || typeof(msg) || typeof(utcsec) AS a FROM logs";

int gather(_SYSLOG_LOG_DATA_tag& record, void* texts) {
    static_cast<Strings*>(texts)->push_back(std::to_string(record.id) + record.msg + record.host + record.prog +
                                            record.ldate + std::to_string(record.utcsec) + std::to_string(record.prio));
    return 0;
}

_SYSLOG_SQL_COND_tag randomCondition(Dice& dice) {
    const int op = static_cast<int>(dice.below(10));
    const std::string star = dice.below(4) == 0 ? "" : "*";
    switch (dice.below(7)) {
    case 0:
        return {SYSLOG_ATTRI_ID, static_cast<int>(dice.below(6)), std::to_string(dice.below(13000)), {}};
    case 1:
        return {SYSLOG_ATTRI_HOST, op, dice.of(kHosts), {}};
    case 2:
        return {SYSLOG_ATTRI_PROG, op, dice.of(kPrograms), {}};
    case 3:
        return {SYSLOG_ATTRI_LLEVEL, static_cast<int>(dice.below(6)), dice.of(kLevels), {}};
    case 4:
        return {SYSLOG_ATTRI_LDATE, static_cast<int>(dice.below(6)), "2024-01-0" + std::to_string(dice.below(10)), {}};
    case 5:
        return {
            SYSLOG_ATTRI_UTCSEC, static_cast<int>(dice.below(6)), std::to_string(1700000000 + dice.below(12000)), {}};
    default:
        return {SYSLOG_ATTRI_MSG, 6 + op % 4, star + dice.of(kWords) + star, {}};
    }
}

Conditions randomConditions(Dice& dice) {
    Conditions conditions;
    for (size_t i = dice.below(4); i > 0; --i) {
        conditions.push_back(randomCondition(dice));
        for (size_t j = dice.below(3); j > 0; --j) {
            const bool sameColumn = dice.below(2) == 0;
            _SYSLOG_SQL_COND_tag other = sameColumn ? conditions.back() : randomCondition(dice);
            other.value = sameColumn && other.attr == SYSLOG_ATTRI_HOST ? dice.of(kHosts) : other.value;
            other.orList.clear();
            conditions.back().orList.push_back(other);
        }
    }
    return conditions;
}

class Archive : public DatabaseTest {
  protected:
    static constexpr int kRows = 12000;

    void SetUp() override {
        run(ReadFile(QUOR_SOURCE "/schema/syslog.sql"));
        Dice dice;
        std::string rows;
        for (int id = 3; id < kRows; id += dice.below(300) == 0 ? 7 : 1) {
            rows += (rows.empty() ? "" : ", ") + row(dice, id);
            if (rows.size() > 100000 || id + 7 >= kRows) {
                run("INSERT OR IGNORE INTO logs (id, msg, prio, ldate, host, prog, fac, ltime, ip, utcsec, pid, sdata, "
                    "rsec) VALUES " +
                    rows);
                rows.clear();
            }
        }
        run("UPDATE db_info SET start_time = 7, device = 'it''s'; DELETE FROM logs WHERE id = 11990;"
            "INSERT INTO general_log (host, msg) VALUES ('h', 'm'); PRAGMA journal_mode = WAL");
        ASSERT_EQ(write(), "0 ");
    }

    std::string write() { return said(QUORArchiveWrite(path_.c_str(), archive_.c_str(), nullptr, nullptr, &report_)); }
    std::string check(const char* source) {
        return said(QUORArchiveCheck(archive_.c_str(), source, nullptr, nullptr, &report_));
    }
    std::string said(int result) const { return std::to_string(result) + " " + report_.error; }

    void expectSame(const std::string& sql) const {
        const Strings plain = answer(path_, sql);
        EXPECT_TRUE(plain == answer(archive_, sql)) << sql;
        EXPECT_TRUE(plain.empty() || plain.front().rfind("error: ", 0) != 0) << plain.front();
    }

    std::string archive_ = folder_.path("log.qar");
    QUORARCHIVE report_ = {};
};

TEST_F(Archive, AnswersRandomSearchesAsTheDatabaseDoes) {
    const char* wanted = getenv("QUOR_ARCHIVE_FILTERS");
    Dice dice;
    for (int i = wanted != nullptr ? static_cast<int>(strtol(wanted, nullptr, 10)) : 120; i > 0 && !HasFailure(); --i) {
        Conditions conditions = randomConditions(dice);
        std::string where;
        SqlCondListToStr(conditions, where);
        SCOPED_TRACE(where);
        _SYSLOG_SQL_ORDER_tag order{static_cast<int32_t>(dice.below(2)), SYSLOG_ATTRI_ID};
        _SYSLOG_SQL_LIMIT_tag limit{dice.below(300), dice.below(3) * 40};
        _SYSLOG_SQL_LIMIT_tag* page = dice.below(3) == 0 ? nullptr : &limit;
        Strings plain;
        Strings archived;
        EXPECT_EQ(SyslogDBSelect(path_, conditions, page, &order, gather, &plain, false), 0);
        EXPECT_EQ(SyslogDBSelect(archive_, conditions, page, &order, gather, &archived, false), 0);
        EXPECT_TRUE(plain == archived) << plain.size() << " rows and " << archived.size();
        EXPECT_EQ(SyslogDBSelectCount(path_, conditions, nullptr, nullptr),
                  SyslogDBSelectCount(archive_, conditions, nullptr, nullptr));
    }
}

TEST_F(Archive, AnswersOtherStatementsAsTheDatabaseDoes) {
    expectSame(std::string(kAll) + " ORDER BY id");
    for (const char* where : {"msg LIKE '%FAILED%'",
                              "msg LIKE '%bgp_5%'",
                              "msg GLOB '*[[]UFW*'",
                              "msg GLOB '*[^a]ailed p*'",
                              "msg GLOB '*'",
                              "instr(lower(msg), 'ufw block')",
                              "(ldate, ltime) >= ('2024-01-03', '10:30')",
                              "host IN ('core', NULL, 5)",
                              "host IS NULL",
                              "host = 5",
                              "host = '5'",
                              "pid = '77'",
                              "id = '4000'",
                              "id IN (5, 9000, 11999)",
                              "id > NULL",
                              "rowid BETWEEN 8190 AND 8200",
                              "host = 'core' COLLATE NOCASE",
                              "host = 'core' OR prog = 'CRON'",
                              "typeof(msg) = 'blob'",
                              "msg GLOB '*\xe2\x82\xac*'",
                              "ldate < '2024-01-02' AND msg LIKE '%link up%'",
                              "utcsec = '5'",
                              "ip >= 'x'"}) {
        expectSame(std::string(kAll) + " WHERE " + where + " ORDER BY id DESC");
        expectSame(std::string("SELECT COUNT(*) AS a FROM logs WHERE ") + where);
    }
    for (const char* sql : {"SELECT quote(host) || count(*) AS a FROM logs GROUP BY host ORDER BY host DESC",
                            "SELECT DISTINCT host AS a FROM logs", "SELECT DISTINCT fac AS a FROM logs",
                            "SELECT llevel AS a FROM logs GROUP BY llevel ORDER BY llevel",
                            "SELECT quote(prog) AS a FROM logs ORDER BY prog", "SELECT max(rowid) AS a FROM logs",
                            "SELECT min(id) AS a FROM logs", "SELECT host_id || host_name AS a FROM hosts",
                            "SELECT device AS a FROM db_info", "SELECT value AS a FROM store_identity",
                            "SELECT max(msg) AS a FROM logs GROUP BY prog ORDER BY prog"}) {
        expectSame(sql);
    }
    for (std::string name : {"host", "prog", "tag", "ldate", "utcsec"}) {
        std::list<std::string> plain;
        std::list<std::string> archived;
        EXPECT_EQ(SyslogDBAttriValueGet(path_, name, nullptr, plain),
                  SyslogDBAttriValueGet(archive_, name, nullptr, archived));
        EXPECT_EQ(plain, archived) << name;
    }
    DBHandler plain(path_, "");
    DBHandler archived(archive_, "");
    ASSERT_EQ(plain.DBCon() + archived.DBCon(), 0);
    EXPECT_EQ(archived.DBLogCountGet(), plain.DBLogCountGet());
    EXPECT_EQ(archived.DBInfoEndGet(), plain.DBInfoEndGet());
    EXPECT_EQ(archived.DBInfoDevSet("other"), 0);
    plain.DBDiscon();
    archived.DBDiscon();
}

TEST_F(Archive, ForgetsAHost) {
    for (std::string path : {path_, archive_}) {
        Conditions host = {{SYSLOG_ATTRI_HOST, SYSLOG_OP_EQUAL, "mail-gate", {}}};
        ASSERT_EQ(SyslogDBDelete(path, host), 0);
        Conditions whole = {{SYSLOG_ATTRI_ID, SYSLOG_OP_AT_MOST, "8500", {}}};
        ASSERT_EQ(SyslogDBDelete(path, whole), 0);
    }
    expectSame(std::string(kAll) + " ORDER BY id");
    expectSame("SELECT DISTINCT host AS a FROM logs");
    EXPECT_EQ(check(path_.c_str()), "0 ");
    EXPECT_EQ(answer(archive_, "INSERT INTO logs (msg) VALUES ('x')"),
              Strings{"error: rows of an archive can be deleted, but not added or changed"});
    SqliteFile(path_).run("DELETE FROM logs WHERE id = 9000");
    EXPECT_NE(check(path_.c_str()), "0 ");
}

TEST_F(Archive, RollsADeletionBack) {
    DBHandler archived(archive_, "");
    ASSERT_EQ(archived.DBCon(), 0);
    archived.DBTranStart();
    EXPECT_EQ(archived.DBExecute("DELETE FROM logs WHERE prog = 'sshd'"), 0);
    archived.DBTranRollback();
    archived.DBDiscon();
    EXPECT_EQ(check(path_.c_str()), "0 ");
}

TEST_F(Archive, BecomesTheSameDatabaseAgain) {
    const std::string fresh = folder_.path("fresh.db");
    ASSERT_EQ(said(QUORArchiveExtract(archive_.c_str(), fresh.c_str(), &report_)), "0 ");
    for (const std::string table :
         {"logs", "general_log", "db_info", "store_identity", "sqlite_stat1", "hosts", "sqlite_sequence ORDER BY name",
          "(SELECT type, name, sql FROM sqlite_schema ORDER BY 1, 2)", "pragma_page_size"}) {
        EXPECT_TRUE(query("SELECT * FROM " + table) == SqliteFile(fresh).query("SELECT * FROM " + table)) << table;
    }
    EXPECT_EQ(SqliteFile(fresh).query("PRAGMA integrity_check"), Strings{"ok"});
}

TEST_F(Archive, LosesNoMoreThanADamagedBlock) {
    const uint64_t rows = report_.rows;
    const Strings whole = answer(archive_, "SELECT id AS a FROM logs WHERE msg IS NOT NULL");
    const Strings first =
        SqliteFile(archive_).query("SELECT min(id), (SELECT min(id) FROM logs_blocks WHERE id > 3) FROM logs_blocks");
    for (const char* damage :
         {"logs_data SET data = substr(data, 1, 5000) || x'55' || substr(data, 5002)", "logs_data SET data = x''",
          "logs_blocks SET head = substr(head, 1, length(head) - 1) || x'99'", "logs_blocks SET head = x'00'"}) {
        SqliteFile(archive_).run(std::string("UPDATE ") + damage + " WHERE id = 3");
        const std::string all = "SELECT id AS a FROM logs WHERE msg || host || ip || pid IS NOT 'x'";
        EXPECT_EQ(answer(archive_, all).at(0).rfind("error: the block of the ids from 3 on is damaged", 0), 0U)
            << damage;
        EXPECT_EQ(answer(archive_, all + " AND id >= " + first[1]).at(0), first[1]) << damage;
        EXPECT_NE(check(nullptr).find("-1 1 of "), std::string::npos) << report_.error;
        EXPECT_LT(report_.rows, rows);
    }
    const std::string fresh = folder_.path("fresh.db");
    EXPECT_EQ(said(QUORArchiveExtract(archive_.c_str(), fresh.c_str(), &report_)), "0 ");
    EXPECT_EQ(report_.damagedBlocks, 1U);
}

TEST_F(Archive, IsWrittenWholeOrNotAtAll) {
    EXPECT_NE(write().find("exists already"), std::string::npos);
    const std::string other = folder_.path("other.qar");
    const std::string partial = folder_.write("other.qar.partial", "somebody's own");
    EXPECT_EQ(QUORArchiveWrite(path_.c_str(), other.c_str(), nullptr, nullptr, &report_), -1);
    EXPECT_NE(std::string(report_.error).find("exists already"), std::string::npos);
    EXPECT_EQ(ReadFile(partial), "somebody's own");
    std::filesystem::remove(partial);
    const auto giveUp = [](unsigned long long, unsigned long long, void*) { return 1; };
    EXPECT_EQ(QUORArchiveWrite(archive_.c_str(), other.c_str(), nullptr, nullptr, &report_), -1);
    EXPECT_NE(std::string(report_.error).find("is an archive already"), std::string::npos);
    EXPECT_EQ(QUORArchiveWrite(folder_.path("none").c_str(), other.c_str(), giveUp, nullptr, nullptr), -1);
    EXPECT_NE(access(other.c_str(), F_OK), 0);
    run("DELETE FROM logs");
    EXPECT_EQ(said(QUORArchiveWrite(path_.c_str(), other.c_str(), giveUp, nullptr, &report_)), "0 ");
    EXPECT_EQ(answer(other, "SELECT max(rowid) AS a FROM logs"), Strings{"NULL"});
    EXPECT_NE(access(partial.c_str(), F_OK), 0);
    EXPECT_EQ(QUORArchiveIs(other.c_str()) + QUORArchiveIs(path_.c_str()) + QUORArchiveIs("/"), 1);
}

}  // namespace

#include <algorithm>
#include <random>

#include "quor/quorsalvage.h"
#include "tests/support/testing.h"

namespace quor::test {
namespace {

constexpr char kLogs[] =
    "CREATE TABLE logs(id INTEGER PRIMARY KEY AUTOINCREMENT, msg TEXT, host TEXT, utcsec INTEGER,"
    " llevel TEXT GENERATED ALWAYS AS (host) VIRTUAL, prog TEXT, extra); CREATE INDEX logs_host ON logs(host);";

enum class Damage { None, Garbage, Zeros, Header, FirstPage, Half, Interior, Pointer };

struct Case {
    const char* name;
    Damage damage;
    uint32_t pageSize;
    const char* encoding = "UTF-8";
};

class Salvaging : public testing::TestWithParam<Case> {
  protected:
    // Logs of all lengths up to several pages, a deleted range, and a second table.
    void fill() {
        SqliteFile db(path_);
        db.run("PRAGMA page_size=" + std::to_string(GetParam().pageSize) + "; PRAGMA encoding='" + GetParam().encoding +
               "'; PRAGMA secure_delete=OFF;" + kLogs +
               "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 12000) "
               "INSERT INTO logs(id, msg, host, utcsec, prog, extra) "
               "SELECT i, hex(zeroblob(CASE WHEN i % 1000 THEN i % 240 ELSE 8190 END)) || i, 'host' || (i % 50), i * "
               "(1 + i % 3 * 3000000000), CASE WHEN i % 9 THEN 'prog' END, "
               "CASE i % 5 WHEN 0 THEN i / 3.0 WHEN 1 THEN zeroblob(i % 7) WHEN 2 THEN i % 3 WHEN 3 THEN -1 << i % 60 "
               "END FROM n;"
               "CREATE TABLE histogram(id INTEGER PRIMARY KEY, device TEXT UNIQUE, count INTEGER);"
               "INSERT INTO histogram VALUES(NULL, 'a', 7), (NULL, 'b', -3);"
               "DELETE FROM logs WHERE id BETWEEN 5000 AND 6999;");
    }

    void overwrite(std::string& file, size_t page, bool garbage) {
        const auto begin = file.begin() + static_cast<long>((page - 1) * GetParam().pageSize);
        std::generate_n(begin, GetParam().pageSize, [&] { return garbage ? static_cast<char>(random_()) : '\0'; });
        lost_ += " OR pageno = " + std::to_string(page);
    }

    void damage() {
        std::string file = ReadFile(path_);
        const Damage kind = GetParam().damage;
        if (kind == Damage::Garbage || kind == Damage::Zeros) {
            for (int i = 0; i < 10; ++i) {
                overwrite(file, 2 + random_() % (file.size() / GetParam().pageSize - 1), kind == Damage::Garbage);
            }
        } else if (kind == Damage::Header) {
            file.replace(0, 100, 100, '\0');
        } else if (kind == Damage::FirstPage) {
            overwrite(file, 1, true);
        } else if (kind == Damage::Interior) {
            overwrite(file, pages("min(pageno)", "pagetype = 'internal'"), false);
        } else if (kind == Damage::Pointer) {
            file[(pages("min(pageno)", "pagetype = 'leaf'") - 1) * GetParam().pageSize + 8] = '\xFF';
        } else if (kind == Damage::Half) {
            file.resize(file.size() / 2 + 99);
            lost_ += " OR pageno > " + std::to_string(file.size() / GetParam().pageSize);
        }
        folder_.write("damaged.db", file);
    }

    // What is asked of the pages of the logs.
    size_t pages(const std::string& what, const std::string& which) {
        return std::stoul(
            SqliteFile(path_).query("SELECT " + what + " FROM dbstat WHERE name = 'logs' AND " + which).at(0));
    }

    TempFolder folder_;
    std::string path_ = folder_.path("whole.db");
    std::string damaged_ = folder_.path("damaged.db");
    std::string saved_ = folder_.path("saved.db");
    std::string lost_ = "0";  // a condition on pages
    std::mt19937 random_{GetParam().pageSize};
};

TEST_P(Salvaging, KeepsTheRowsOfEveryUndamagedPageAndNoOther) {
    fill();
    damage();
    const std::string before = ReadFile(damaged_);
    const std::string schema = folder_.write("schema.sql", std::string("PRAGMA page_size=4096;") + kLogs);
    const std::string few = folder_.write("few.sql", "CREATE TABLE log(id INTEGER PRIMARY KEY, event TEXT);");
    const std::string numbers =
        folder_.write("n.sql", "CREATE TABLE log(id INTEGER PRIMARY KEY, msg INTEGER, c, d, e, f);");
    const std::string texts = folder_.write("t.sql", "CREATE TABLE log(id INTEGER PRIMARY KEY, b, c, d TEXT, e, f);");
    const char* const schemas[] = {few.c_str(), numbers.c_str(), texts.c_str(), schema.c_str(), nullptr};

    QUORSALVAGE report;
    ASSERT_EQ(QUORDBSalvage(damaged_.c_str(), saved_.c_str(), schemas, nullptr, nullptr, &report), 0) << report.error;

    const uint64_t expected = pages("sum(ncell)", "pagetype = 'leaf' AND NOT (" + lost_ + ")");
    SqliteFile db(saved_);
    db.run("ATTACH '" + path_ + "' AS whole");
    const uint64_t saved = std::stoull(db.query("SELECT count(*) FROM logs").at(0));
    const bool whole = GetParam().damage == Damage::None && report.schemaRead != 0;
    const bool pointer = GetParam().damage == Damage::Pointer;
    const bool pagesLost = lost_ != "0" && GetParam().damage != Damage::FirstPage;  // some of them of long rows
    EXPECT_GE(saved, pagesLost ? expected * 99 / 100 : expected - (pointer ? 1 : 0));
    EXPECT_STREQ(report.error, "");
    EXPECT_GE(report.tables[0].rows, saved);
    EXPECT_EQ(report.badPages == 0, whole || pointer || GetParam().damage == Damage::Header);
    EXPECT_TRUE(!pointer || report.badRows == 1);
    EXPECT_TRUE(!whole || report.badRows + report.strayRows + report.duplicates + report.unknownRows == 0);
    EXPECT_EQ(report.pages, before.size() / GetParam().pageSize);
    if (report.schemaRead == 0) {
        EXPECT_EQ(report.strayRows, saved);
        EXPECT_GE(report.unknownRows, 3U) << "those of the other tables";
    }
    EXPECT_EQ(!db.query("SELECT id FROM logs EXCEPT SELECT id FROM whole.logs").empty(),
              GetParam().damage == Damage::FirstPage)
        << "deleted rows return only when the definitions and the list of free pages are lost";
    EXPECT_EQ(db.query("SELECT * FROM logs WHERE id NOT BETWEEN 5000 AND 6999 EXCEPT SELECT * FROM whole.logs"),
              Strings());
    EXPECT_EQ(db.query("PRAGMA integrity_check; PRAGMA journal_mode"), (Strings{"ok", "wal"}));
    EXPECT_EQ(ReadFile(damaged_), before);
}

INSTANTIATE_TEST_SUITE_P(
    Damages, Salvaging,
    testing::Values(Case{"nothing", Damage::None, 512}, Case{"garbage", Damage::Garbage, 4096},
                    Case{"zeros", Damage::Zeros, 16384}, Case{"header", Damage::Header, 4096},
                    Case{"firstPage", Damage::FirstPage, 4096}, Case{"firstLargePage", Damage::FirstPage, 16384},
                    Case{"firstSmallPage", Damage::FirstPage, 512}, Case{"half", Damage::Half, 4096},
                    Case{"halfLarge", Damage::Half, 65536}, Case{"interior", Damage::Interior, 4096},
                    Case{"pointer", Damage::Pointer, 4096}, Case{"littleEndian", Damage::None, 4096, "UTF-16le"},
                    Case{"bigEndian", Damage::None, 4096, "UTF-16be"}),
    [](const auto& each) { return std::string(each.param.name); });

// The rows of a writer that was killed stand in the log; those after its broken frame were never promised.
TEST(Salvage, AppliesTheWriteAheadLog) {
    const TempFolder folder;
    const std::string path = folder.path("live.db");
    SqliteFile db(path);
    db.run(std::string("PRAGMA journal_mode=WAL; PRAGMA wal_autocheckpoint=0;") + kLogs);
    const auto insert = [&db](int count) {
        db.run("WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n LIMIT " + std::to_string(count) +
               ") INSERT INTO logs(msg) SELECT 'message ' || i FROM n");
    };
    insert(500);
    db.run("PRAGMA wal_checkpoint(TRUNCATE)");
    insert(300);
    const size_t promised = ReadFile(path + "-wal").size();
    insert(200);
    const std::string log = ReadFile(path + "-wal");
    QUORSALVAGE report;
    // One byte is broken: none of the log, one of its header, and one of the first frame behind what was promised.
    for (const size_t broken : std::initializer_list<size_t>{log.size(), 0, 9, 17, 25, 29, promised + 8, promised + 17,
                                                             promised + 21, promised + 99}) {
        std::string changed = log + '\0';
        changed[broken] ^= 1;
        const std::string copy = folder.write(std::to_string(broken), ReadFile(path));
        folder.write(std::to_string(broken) + "-wal", changed);
        EXPECT_EQ(QUORDBSalvage(copy.c_str(), (copy + ".new").c_str(), nullptr, nullptr, nullptr, &report), 0);
        EXPECT_EQ(report.tables[0].rows, broken == log.size() ? 1000U : broken < promised ? 500U : 800U) << broken;
    }
    const std::string lost = folder.write("lost", "");  // the log alone, without its last transaction
    folder.write("lost-wal", log.substr(0, log.size() - 1));
    EXPECT_EQ(QUORDBSalvage(lost.c_str(), (lost + ".new").c_str(), nullptr, nullptr, nullptr, &report), 0);
    EXPECT_TRUE(report.tables[0].rows >= 300 && report.tables[0].rows < 500) << report.tables[0].rows;
}

// A definition may define a table, and nothing else.
TEST(Salvage, RunsNoQueryOfTheDamagedFile) {
    const TempFolder folder;
    const std::string path = folder.path("hostile.db");
    SqliteFile(path).run(
        std::string(kLogs) +
        "CREATE TABLE evil(a); INSERT INTO logs(msg) VALUES('x'); CREATE UNIQUE INDEX once ON logs(msg);"
        "PRAGMA writable_schema=ON; UPDATE sqlite_master SET "
        "sql = 'CREATE TABLE evil AS SELECT sqlite_version() AS a' WHERE name = 'evil'");
    const std::string saved = folder.path("saved.db");
    QUORSALVAGE report;
    ASSERT_EQ(QUORDBSalvage(path.c_str(), saved.c_str(), nullptr, nullptr, nullptr, &report), 0) << report.error;
    EXPECT_EQ(
        SqliteFile(saved).query("SELECT name FROM sqlite_master WHERE name IN ('logs', 'logs_host', 'once', 'evil')"),
        (Strings{"logs", "logs_host", "once"}));
}

TEST(Salvage, RefusesAndLeavesNothing) {
    const TempFolder folder;
    const std::string path = folder.path("logs.db");
    SqliteFile(path).run(std::string(kLogs) + "INSERT INTO logs(msg) VALUES('x')");
    const std::string text = folder.write("text", std::string(9999, 'x'));
    const std::string fresh = folder.path("fresh.db");
    const auto giveUp = [](unsigned long long, unsigned long long, void*) { return 1; };
    const std::tuple<const char*, std::string, QUORSALVAGEPROGRESS, const char*> cases[] = {
        {path.c_str(), path, nullptr, "new file"},
        {path.c_str(), "/nonexistent/fresh.db", nullptr, "new file"},
        {path.c_str(), fresh, giveUp, "given up"},
        {text.c_str(), fresh, nullptr, "cannot be read"},
        {folder.path().c_str(), fresh, nullptr, "cannot be read"},
        {nullptr, fresh, nullptr, "two files"}};
    for (const auto& [damaged, into, progress, reason] : cases) {
        QUORSALVAGE report;
        EXPECT_EQ(QUORDBSalvage(damaged, into.c_str(), nullptr, progress, nullptr, &report), -1);
        EXPECT_NE(std::string(report.error).find(reason), std::string::npos) << report.error;
        EXPECT_FALSE(std::filesystem::exists(fresh) || std::filesystem::exists(fresh + ".partial"));
    }
}

}  // namespace
}  // namespace quor::test

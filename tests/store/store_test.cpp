// Logs asked for through the store, in a real database.
#include <fnmatch.h>

#include <numeric>

#include "store/ask.h"
#include "store/context.h"
#include "store/counted.h"
#include "store/failure.h"
#include "store/follower.h"
#include "store/merge.h"
#include "store/selection.h"
#include "tests/support/testing.h"

using namespace quor::store;
using namespace quor::test;

namespace {

using Ids = std::vector<uint64_t>;

class Store : public testing::Test {
  protected:
    Store() { begin(); }
    ~Store() override { TakeSystemLog(); }

    void run(const std::string& sql) const { SqliteFile(path_).run(sql); }
    void begin() const {
        run("CREATE TABLE logs(id INTEGER PRIMARY KEY, host, ip, fac, prio, llevel AS (prio), tag, utcsec, tzoffset,"
            " ldate, ltime, prog, msg)");
    }
    void replace() const {
        std::filesystem::remove(path_);
        begin();
    }
    static RecordHandler into(Ids& ids) {
        return [&ids](const _SYSLOG_LOG_DATA_tag& record) { ids.push_back(record.id); };
    }
    Ids select(const Selection& selection) const {
        Ids ids;
        const uint64_t rows = Select(*OpenSource(path_), selection, into(ids));
        EXPECT_EQ(rows, ids.size());
        return ids;
    }
    static Ids poll(Follower& follower) {
        Ids ids;
        follower.poll(into(ids));
        return ids;
    }

    const TempFolder folder_;
    const std::string path_ = folder_.path("logs.db");
};

// What a request ends with: the name of its cause and its text.
std::string failureOf(const std::function<void()>& request) {
    constexpr const char* kCauses[] = {"usage: ", "missing: ", "denied: ", "busy: ", "damaged: ", "other: "};
    try {
        request();
        return "";
    } catch (const Failure& failure) {
        return kCauses[static_cast<size_t>(failure.cause())] + std::string(failure.what());
    }
}

// Each row has one of these as its host, its program and its facility, and within its message.
const Strings kHostile = {"plain", "Plain", "a'b",    "''",     "\"",        ";",         "--", "/*", "[x]",
                          "[",     "]",     "(",      "\\",     "\\'",       "%",         "_",  "`",  "*",
                          "?",     "***",   "x*y",    "xzy",    "' OR 1 --", "'; END;--", "\t", "\n", "\x1b[2J",
                          "\xff",  "\xc3",  "\u00e9", "\ufffd", "\uffff",    "any thing", "0"};

TEST_F(Store, HostileFiltersFindAndDeleteTheirRowsAlone) {
    SqliteFile file(path_);
    for (const std::string& text : kHostile) {
        file.run(std::unique_ptr<char, decltype(&sqlite3_free)>(
                     sqlite3_mprintf("INSERT INTO logs(host, prog, fac, msg) VALUES(%Q, %Q, %Q, 'a' || %Q || 'b')",
                                     text.c_str(), text.c_str(), text.c_str(), text.c_str()),
                     sqlite3_free)
                     .get());
    }
    for (size_t i = 0; i < kHostile.size(); ++i) {
        const std::string& text = kHostile[i];
        for (const auto member : {&FilterOptions::host, &FilterOptions::program, &FilterOptions::facility}) {
            FilterOptions options;
            options.*member = {text};
            EXPECT_EQ(select({"logs", BuildFilter(options, "logs", 0)}), Ids{i + 1}) << text;
        }
        FilterOptions options;
        options.keyword = text;
        const Selection selection{"logs", BuildFilter(options, "logs", 0)};
        Ids expected;
        for (size_t id = kHostile.size(); id > 0; --id) {
            if (("a" + kHostile[id - 1] + "b").find(text) != std::string::npos) {
                expected.push_back(id);
            }
        }
        EXPECT_EQ(select(selection), expected) << text;
        EXPECT_EQ(Count(*OpenSource(path_), selection), expected.size()) << text;
    }
    for (size_t i = 0; i < kHostile.size(); ++i) {
        FilterOptions options;
        options.host = {kHostile[i]};
        OpenSource(path_)->remove(BuildFilter(options, "logs", 0).conditions);
        EXPECT_EQ(LargestId(*OpenSource(path_), "logs"), i + 1 < kHostile.size() ? kHostile.size() : 0);
        EXPECT_EQ(select({}).size(), kHostile.size() - i - 1) << kHostile[i];
    }
}

// Every row near a hit once, as grep would: "5* 6 -- 9 ".
std::string around(const Ids& all, const std::vector<size_t>& hits, uint64_t lead, uint64_t trail) {
    std::string text;
    size_t last = SIZE_MAX;
    for (size_t at = 0; at < all.size(); ++at) {
        const bool near =
            std::any_of(hits.begin(), hits.end(), [&](size_t hit) { return at + lead >= hit && at <= hit + trail; });
        const bool hit = std::find(hits.begin(), hits.end(), at) != hits.end();
        text += !near ? ""
                      : (last != SIZE_MAX && last + 1 < at ? "-- " : "") + std::to_string(all[at]) + (hit ? "* " : " ");
        last = near ? at : last;
    }
    return text;
}

TEST_F(Store, RowsAroundHitsComeOnceAndInOrder) {
    run("WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 70) INSERT INTO logs(id, host) "
        "SELECT i, iif(i IN (1, 2, 10, 11, 13, 20, 33, 34, 40, 57, 70), 'hit', 'x') FROM n WHERE i % 7 OR i = 70");
    FilterOptions filter;
    filter.host = {"hit"};
    for (size_t variant = 0; variant < size_t{5} * 4 * 2 * 3 * 2; ++variant) {
        const Context context{Ids{0, 1, 2, 6, 100}[variant % 5], Ids{0, 1, 3, 100}[variant / 5 % 4]};
        Selection selection{"logs", BuildFilter(filter, "logs", 0)};
        selection.oldestFirst = variant / 20 % 2 != 0;
        selection.limit = Ids{0, 1, 4}[variant / 40 % 3];
        selection.offset = Ids{0, 2}[variant / 120];
        Selection every;
        every.oldestFirst = selection.oldestFirst;
        const Ids all = select(every);
        std::vector<size_t> hits;
        for (const uint64_t id : select(selection)) {
            hits.push_back(static_cast<size_t>(std::find(all.begin(), all.end(), id) - all.begin()));
        }
        std::string text;
        SelectWithContext(*OpenSource(path_), selection, context, [&](const Record& record, bool hit, bool apart) {
            text += (apart ? "-- " : "") + std::to_string(record.id) + (hit ? "* " : " ");
        });
        EXPECT_EQ(text, around(all, hits, selection.oldestFirst ? context.before : context.after,
                               selection.oldestFirst ? context.after : context.before))
            << variant;
    }
}

TEST_F(Store, EveryRowOfALargeTableComesInOrder) {
    run("WITH RECURSIVE n(i) AS (SELECT 5 UNION ALL SELECT i + 1 FROM n WHERE i < 30000) "
        "INSERT INTO logs(id, host, msg) SELECT i + (i > 20000) * 1000000000, iif(i % 5000, 'common', 'rare'), 'm?' "
        "FROM n");
    Ids all(29996);
    std::iota(all.begin(), all.begin() + 19996, 5);
    std::iota(all.begin() + 19996, all.end(), 1000020001);
    Selection selection;
    selection.oldestFirst = true;
    EXPECT_EQ(select(selection), all);
    Ids after;
    uint64_t position = 10;
    while (SelectAfter(*OpenSource(path_), {}, position, into(after)) == kPiece) {
    }
    EXPECT_EQ(after, Ids(all.begin() + 6, all.end()));
    EXPECT_EQ(position, all.back());
    selection.offset = 19995;
    selection.limit = 2;
    EXPECT_EQ(select(selection), (Ids{20000, 1000020001}));
    std::reverse(all.begin(), all.end());
    EXPECT_EQ(select({}), all);
    EXPECT_EQ(select({"logs", {{}, "m?"}, 9000, 100}), Ids(all.begin() + 100, all.begin() + 9100));
    EXPECT_EQ(select({"logs", {{}, "m?"}, 1, 3}), Ids{all[3]});
    FilterOptions rare;
    rare.host = {"rare"};
    rare.keyword = "m?";
    EXPECT_EQ(select({"logs", BuildFilter(rare, "logs", 0)}), (Ids{1000030000, 1000025000, 20000, 15000, 10000, 5000}));
}

TEST_F(Store, AFollowerSeesWhatArrivesAndWhatReplacesIt) {
    FilterOptions wanted;
    wanted.host = {"a"};
    run("INSERT INTO logs(host) VALUES('a'), ('b'), ('a'), ('a')");
    const auto source = OpenSource(path_);
    Follower follower(*source, {"logs", BuildFilter(wanted, "logs", 0), 1, 7, true});
    run("INSERT INTO logs(host) VALUES('a'), ('b')");
    for (const auto& [rows, expected] : std::map<uint64_t, Ids>{{0, {1, 3, 4}}, {2, {3, 4}}}) {
        Ids ids;
        follower.last(rows, into(ids));
        EXPECT_EQ(ids, expected);
    }
    EXPECT_EQ(poll(follower), Ids{5});
    run("UPDATE logs SET host = 'a' WHERE id = 6");
    EXPECT_EQ(poll(follower), Ids{}) << "looked over once";
    run("INSERT INTO logs(host) VALUES('a')");
    EXPECT_EQ(poll(follower), Ids{7});
    replace();
    EXPECT_EQ(poll(follower), Ids{});
    run("INSERT INTO logs(host) VALUES('a')");
    EXPECT_EQ(poll(follower), Ids{1});
    replace();
    run("INSERT INTO logs(host) VALUES('a'), ('a')");
    EXPECT_EQ(poll(follower), (Ids{1, 2})) << "although the inode may be the same";
    std::filesystem::rename(path_, path_ + ".away");
    EXPECT_EQ(poll(follower), Ids{}) << "no file";
    std::filesystem::rename(path_ + ".away", path_);
    EXPECT_EQ(poll(follower), Ids{}) << "the old one again";
    std::filesystem::remove(path_);
    SqliteFile(path_).run("CREATE TABLE other(id)");
    EXPECT_EQ(poll(follower), Ids{}) << "no table yet";
    begin();
    run("INSERT INTO logs(host) VALUES('a')");
    EXPECT_EQ(poll(follower), Ids{1});
    {
        SqliteFile lock(path_);
        lock.run("BEGIN EXCLUSIVE; INSERT INTO logs(host) VALUES('a')");
        EXPECT_EQ(poll(follower), Ids{}) << "locked";
        lock.run("COMMIT");
    }
    EXPECT_EQ(poll(follower), Ids{2});
    run("DROP TABLE logs");
    EXPECT_NE(failureOf([&] { poll(follower); }).find("missing: "), std::string::npos) << "the table was there";
}

TEST_F(Store, WhatWasPutThereHasNotArrived) {
    const auto source = OpenSource(path_);
    Follower follower(*source, {});
    run("CREATE TABLE store_merged(first INTEGER PRIMARY KEY, last INTEGER)");
    run("INSERT INTO store_merged VALUES(1, 20000), (20002, 20003), (20005, 20006)");
    run("WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 20006) INSERT INTO logs(id) SELECT i "
        "FROM n");
    EXPECT_EQ(poll(follower), (Ids{20001, 20004}));
    EXPECT_EQ(NewestReceived(*source), 20004U);
    run("INSERT INTO logs(host) VALUES('a')");
    EXPECT_EQ(poll(follower), Ids{20007});
}

TEST_F(Store, AMergeAddsWhatIsMissingOnceInTheOrderOfItsDates) {
    const std::string other = folder_.path("other.db");
    SqliteFile(other).run("CREATE TABLE logs(id INTEGER PRIMARY KEY, host TEXT, ldate TEXT, ltime, msg)");
    SqliteFile(other).run(
        "INSERT INTO logs(host, ldate, ltime, msg) VALUES('a', '2', '1', 5), ('a', '1', '1', x'00'), "
        "('a', '1', '1', x'0001'), ('b', NULL, NULL, NULL), ('c', '1', '1', 'c'), ('c', '1', '1', 'c')");
    run("INSERT INTO logs(host, ldate, ltime, msg) VALUES('c', '1', '1', 'c'), ('a', '2', '1', 5), ('d', '', '', '')");
    const MergeProgress ignore = [](uint64_t /*part*/, uint64_t /*parts*/) {};
    const Merged first = MergeRows(other, path_, ignore);
    EXPECT_EQ(std::make_pair(first.added, first.there), std::make_pair(uint64_t{4}, uint64_t{2}));
    EXPECT_EQ(MergeRows(other, path_, ignore).added, 0U);
    EXPECT_EQ(Ask(path_, "SELECT quote(msg) AS msg FROM logs WHERE id > 3 ORDER BY id", "msg"),
              (std::vector<std::string>{"NULL", "X'00'", "X'0001'", "'c'"}));
}

TEST_F(Store, FailuresSayWhyAndWhatToDo) {
    const std::string locked = folder_.path("db check.db");
    SqliteFile holder(locked);
    holder.run("CREATE TABLE logs(id); BEGIN EXCLUSIVE");
    folder_.write("text.db", std::string(5000, 'x'));
    const auto ask = [&](const std::string& name) { return [&, name] { RequireTable(folder_.path(name), "logs"); }; };
    const std::pair<std::function<void()>, const char*> cases[] = {
        {ask("logs.db"), ""},
        {ask("text.db"), "damaged: *: file is not a database; run quorlog db check on it"},
        {ask("none.db"), "missing: cannot open *; make sure that it is a database and that you may read it"},
        {ask(""), "denied: cannot open *; make sure that it is a database and that you may read it"},
        {[&] { OpenSource(path_)->count("general_log", {}); }, "missing: *no such table: general_log;*"},
        {[&] { OpenSource(path_)->values(SYSLOG_ATTRI_FSIZE, {}); }, "missing: *no such column: fsize;*"},
        {[&] { OpenSource(folder_.path("db check.db"))->remove({}); },
         "busy: *db check.db: database is locked; another program is using it; try again"},
    };
    for (const auto& [request, expected] : cases) {
        const std::string failure = failureOf(request);
        EXPECT_EQ(fnmatch(expected, failure.c_str(), 0), 0) << failure << " for " << expected;
    }
}

}  // namespace

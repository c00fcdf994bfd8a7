// Searches beside the same work by hand. An operation is named WORK/WHO/ROWS; "ours" is the library.
#include "bench/search/operations.h"

#include <benchmark/benchmark.h>

#include <functional>
#include <stdexcept>

#include "bench/search/rivals.h"
#include "bench/search/rows.h"
#include "bench/search/tables.h"

namespace quor::bench {
namespace {

using Work = std::function<uint64_t()>;
using Conditions = std::list<_SYSLOG_SQL_COND_tag>;

void add(const std::string& name, const Work& work) {
    benchmark::RegisterBenchmark(name.c_str(), [work](benchmark::State& state) {
        for (auto _ : state) {
            benchmark::DoNotOptimize(work());
        }
    })->Unit(benchmark::kMicrosecond);
}

uint64_t select(std::string path, Conditions conditions, bool page) {
    _SYSLOG_SQL_LIMIT_tag limit{50, 0};
    _SYSLOG_SQL_ORDER_tag order{0, SYSLOG_ATTRI_ID};
    uint64_t sum = 0;
    if (SyslogDBSelect(path, conditions, page ? &limit : nullptr, page ? &order : nullptr, AddUp, &sum, false) != 0) {
        throw std::runtime_error("the selection failed");
    }
    return sum;
}

uint64_t count(std::string path, Conditions conditions) {
    return static_cast<uint64_t>(SyslogDBSelectCount(path, conditions, nullptr, nullptr));
}

Work byHand(const std::string& path, const std::string& sql) {
    return [=] { return static_cast<uint64_t>(RunByHand(path, sql)); };
}

void addUnfiltered(int64_t rows) {
    const std::string path = TablePath(rows);
    const std::string suffix = "/" + std::to_string(rows);
    add("page/ours" + suffix, [=] { return select(path, {}, true); });
    add("page/hand" + suffix,
        byHand(path, "SELECT *, (SELECT max(rowid) FROM logs) totalCount FROM logs WHERE ( id > totalCount - 50 AND "
                     "id <= totalCount - 0) ORDER BY id desc"));
    add("count/ours" + suffix, [=] { return count(path, {}); });
    add("count/hand" + suffix, byHand(path, "SELECT max(rowid) FROM logs"));
}

void addEveryRow(int64_t rows) {
    const std::string path = TablePath(rows);
    const std::string suffix = "/" + std::to_string(rows);
    add("all/ours" + suffix, [=] { return select(path, {}, false); });
    add("all/fastest-loop" + suffix, [=] { return FastestLoop(path); });
    add("all/usual-loop" + suffix, [=] { return UsualLoop(path); });
    if (rows <= kSmall) {
        add("all/get-table" + suffix, [=] { return WholeTable(path); });
    }
}

// Ours on the shipped table, by hand on the plain one.
void addFiltered() {
    const struct {
        const char* name;
        _SYSLOG_SQL_COND_tag condition;
        const char* where;
    } searches[] = {
        {"host-common", {SYSLOG_ATTRI_HOST, 0, kCommonHost, {}}, "host = 'core-switch'"},
        {"host-rare", {SYSLOG_ATTRI_HOST, 0, kRareHost, {}}, "host = 'lobby-printer'"},
        {"host-absent", {SYSLOG_ATTRI_HOST, 0, kAbsentName, {}}, "host = 'no-such-name'"},
        {"prog-rare", {SYSLOG_ATTRI_PROG, 0, kRareProgram, {}}, "prog = 'mcelog'"},
        {"prog-absent", {SYSLOG_ATTRI_PROG, 0, kAbsentName, {}}, "prog = 'no-such-name'"},
        {"days", {SYSLOG_ATTRI_LDATE, 5, "2024-01-08", {}}, "ldate >= '2024-01-08'"},
        {"two-hosts",
         {SYSLOG_ATTRI_HOST, 0, kCommonHost, {{SYSLOG_ATTRI_HOST, 0, "mailgate", {}}}},
         "host = 'core-switch' OR host = 'mailgate'"},
    };
    const std::string shipped = TablePath(kLarge);
    const std::string plain = TablePath(kLarge, Layout::kPlain);
    for (const auto& search : searches) {
        const Conditions conditions = {search.condition};
        add(std::string(search.name) + "/ours", [=] { return select(shipped, conditions, true); });
        add(std::string(search.name) + "/plain-table",
            byHand(plain, std::string("SELECT * FROM logs WHERE ") + search.where + " ORDER BY id DESC LIMIT 50"));
    }
    const Conditions keyword = {{SYSLOG_ATTRI_MSG, 8, "*Failed password*", {}}};
    add("keyword/ours", [=] { return count(shipped, keyword); });
    add("keyword/plain-table", byHand(plain, "SELECT COUNT(*) FROM logs WHERE msg GLOB '*Failed password*'"));
    const std::string middle = "SELECT * FROM logs ORDER BY id DESC LIMIT 50 OFFSET " + std::to_string(kLarge / 2);
    add("page/offset/" + std::to_string(kLarge), byHand(shipped, middle));
    add("page/offset-plain-table/" + std::to_string(kLarge), byHand(plain, middle));
}

void addNames() {
    const std::string path = TablePath(kLarge);
    add("values/ours", [path] {
        std::list<std::string> values;
        std::string attribute = "host";
        std::string own = path;
        SyslogDBAttriValueGet(own, attribute, nullptr, values);
        return static_cast<uint64_t>(values.size());
    });
    add("names/distinct", byHand(path, "SELECT DISTINCT host FROM logs"));
}

}  // namespace

void AddSearches(bool huge) {
    for (const int64_t rows : {kSmall, kLarge}) {
        addUnfiltered(rows);
        addEveryRow(rows);
    }
    if (huge) {
        addUnfiltered(kHuge);
    }
    addFiltered();
    addNames();
}

}  // namespace quor::bench

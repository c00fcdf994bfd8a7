#include "bench/search/rivals.h"

#include <sqlite3.h>

#include <array>
#include <cstdlib>
#include <stdexcept>
#include <string_view>
#include <utility>

namespace quor::bench {
namespace {

constexpr const char* kAllRows = "SELECT * FROM logs";

constexpr std::array<std::pair<const char*, std::string _SYSLOG_LOG_DATA_tag::*>, 9> kTexts = {{
    {"host", &_SYSLOG_LOG_DATA_tag::host},
    {"ip", &_SYSLOG_LOG_DATA_tag::ip},
    {"tag", &_SYSLOG_LOG_DATA_tag::tag},
    {"tzoffset", &_SYSLOG_LOG_DATA_tag::tzoffset},
    {"ldate", &_SYSLOG_LOG_DATA_tag::ldate},
    {"ltime", &_SYSLOG_LOG_DATA_tag::ltime},
    {"prog", &_SYSLOG_LOG_DATA_tag::prog},
    {"msg", &_SYSLOG_LOG_DATA_tag::msg},
    {"fac", &_SYSLOG_LOG_DATA_tag::fac},
}};

class Session {
  public:
    Session(const std::string& path, int flags) {
        if (sqlite3_open_v2(path.c_str(), &db, SQLITE_OPEN_READWRITE | flags, nullptr) != SQLITE_OK) {
            throw std::runtime_error("cannot open " + path);
        }
    }
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;
    ~Session() {
        sqlite3_finalize(statement);
        sqlite3_close(db);
    }

    void prepare(const std::string& sql) {
        if (sqlite3_prepare_v2(db, sql.c_str(), -1, &statement, nullptr) != SQLITE_OK) {
            throw std::runtime_error(sqlite3_errmsg(db));
        }
    }
    int column(std::string_view name) const {
        int i = 0;
        while (name != sqlite3_column_name(statement, i)) {
            ++i;
        }
        return i;
    }
    const char* text(int column) const { return reinterpret_cast<const char*>(sqlite3_column_text(statement, column)); }

    sqlite3* db = nullptr;
    sqlite3_stmt* statement = nullptr;
};

// The columns are found once, by `set(field, column)` for each text.
template <typename Set>
uint64_t loop(Session& session, Set set) {
    session.prepare(kAllRows);
    std::array<int, kTexts.size()> columns{};
    for (size_t i = 0; i < kTexts.size(); ++i) {
        columns[i] = session.column(kTexts[i].first);
    }
    const int id = session.column("id");
    const int utcsec = session.column("utcsec");
    const int prio = session.column("prio");
    _SYSLOG_LOG_DATA_tag record;
    uint64_t sum = 0;
    while (sqlite3_step(session.statement) == SQLITE_ROW) {
        for (size_t i = 0; i < kTexts.size(); ++i) {
            set(record.*kTexts[i].second, columns[i]);
        }
        record.id = static_cast<unsigned long long>(sqlite3_column_int64(session.statement, id));
        record.utcsec = sqlite3_column_int64(session.statement, utcsec);
        record.prio = PriorStrToType(session.text(prio));
        AddUp(record, &sum);
    }
    return sum;
}

}  // namespace

int AddUp(_SYSLOG_LOG_DATA_tag& record, void* sum) {
    *static_cast<uint64_t*>(sum) += record.id + record.msg.size() + static_cast<uint64_t>(record.prio);
    return 0;
}

int64_t RunByHand(const std::string& path, const std::string& sql) {
    Session session(path, 0);
    session.prepare(sql);
    int64_t rows = 0;
    for (; sqlite3_step(session.statement) == SQLITE_ROW; ++rows) {
        for (int i = 0; i < sqlite3_column_count(session.statement); ++i) {
            (void)session.text(i);
        }
    }
    return rows;
}

uint64_t FastestLoop(const std::string& path) {
    Session session(path, SQLITE_OPEN_NOMUTEX);
    return loop(session, [&](std::string& field, int column) {
        sqlite3_value* value = sqlite3_column_value(session.statement, column);
        const auto* text = reinterpret_cast<const char*>(sqlite3_value_text(value));
        field.assign(text, static_cast<size_t>(sqlite3_value_bytes(value)));
    });
}

uint64_t UsualLoop(const std::string& path) {
    Session session(path, 0);
    return loop(session, [&](std::string& field, int column) { field = session.text(column); });
}

uint64_t WholeTable(const std::string& path) {
    Session session(path, 0);
    char** table = nullptr;
    int rows = 0;
    int count = 0;
    sqlite3_get_table(session.db, kAllRows, &table, &rows, &count, nullptr);
    const auto column = [&](std::string_view name) {
        int i = 0;
        while (name != table[i]) {
            ++i;
        }
        return i;
    };
    _SYSLOG_LOG_DATA_tag record;
    uint64_t sum = 0;
    for (int row = 1; row <= rows; ++row) {
        char** fields = table + static_cast<ptrdiff_t>(row) * count;
        for (const auto& [name, member] : kTexts) {
            record.*member = fields[column(name)];
        }
        record.id = strtoull(fields[column("id")], nullptr, 10);
        record.utcsec = strtoll(fields[column("utcsec")], nullptr, 10);
        record.prio = PriorStrToType(fields[column("prio")]);
        AddUp(record, &sum);
    }
    sqlite3_free_table(table);
    return sum;
}

}  // namespace quor::bench

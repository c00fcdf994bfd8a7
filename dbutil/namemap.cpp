#include <syslog.h>

#include <array>

#include "dbutil/query.h"

namespace {

// Where the names of one kind stand: a key table in a version 1 database, a column of logs in version 2.
struct NameSource {
    const char* table;
    const char* idColumn;
    const char* nameColumn;
    const char* logColumn;
};

// By _SYSLOG_EXTKEY_TB_TYPE_tag.
constexpr std::array<NameSource, 4> kNameSources{{
    {"hosts", "host_id", "host_name", "host"},
    {"progs", "prog_id", "prog_name", "prog"},
    {"tags", "tag_id", "tag_name", "tag"},
    {"facs", "fac_id", "fac_name", "fac"},
}};

}  // namespace

int SyslogDBExtkeyMapGet(std::string& dbPath, _SYSLOG_EXTKEY_TB_TYPE_tag type,
                         std::map<unsigned long long, std::string>& map) {
    const bool keyTables = SyslogDBVersionGet(dbPath) == 1;
    quor::Query query;
    if (!quor::CheckDbPath(dbPath, quor::place::kNamesPath) || static_cast<uint32_t>(type) >= kNameSources.size() ||
        !query.connect(dbPath)) {
        return -1;
    }
    const NameSource& source = kNameSources[static_cast<size_t>(type)];
    const std::string sql = keyTables ? std::string("SELECT * FROM ") + source.table
                                      : std::string("SELECT DISTINCT ") + source.logColumn + " FROM logs";
    if (query.execute(sql) < 0) {
        return -1;
    }
    map.clear();
    const bool complete = query.eachRow([&](const quor::Row& row) {
        const unsigned long long key = keyTables ? quor::ToUint64(row[source.idColumn]) : map.size();
        map.emplace(key, row[keyTables ? source.nameColumn : source.logColumn]);
        return true;
    });
    return complete ? 0 : -1;
}

unsigned long long SyslogDBExtkeyLookupByName(std::string& dbPath, _SYSLOG_EXTKEY_TB_TYPE_tag type, std::string name) {
    std::map<unsigned long long, std::string> map;
    if (SyslogDBExtkeyMapGet(dbPath, type, map) < 0) {
        syslog(LOG_ERR, "%s:%d Fail to get foreign key map", "dbutil", quor::place::kLookupMap);
        return 0;
    }
    for (const auto& [key, value] : map) {
        if (value == name) {
            return key;
        }
    }
    return 0;
}

int SyslogDBAttriValueGet(std::string& dbPath, std::string& attrName, _SYSLOG_SQL_LIMIT_tag* limit,
                          std::list<std::string>& values) {
    if (!quor::CheckDbPath(dbPath, quor::place::kValuesPath)) {
        return -1;
    }
    if (LogAttriType(attrName) == SYSLOG_ATTRI_NONE) {
        syslog(LOG_ERR, "%s:%d Log attribute type is incorrect!", "dbutil", quor::place::kValuesAttribute);
        return -1;
    }
    const std::string sql = "SELECT " + attrName + " FROM logs GROUP BY " + attrName + " ORDER BY " + attrName + " asc";
    quor::Query query;
    if (!query.connect(dbPath) || query.execute(sql, limit) < 0) {
        return -1;
    }
    const bool complete = query.eachRow([&](const quor::Row& row) {
        values.emplace_back(row[attrName.c_str()]);
        return true;
    });
    return complete ? 0 : -1;
}

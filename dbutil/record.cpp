#include <array>
#include <cstring>

#include "common/handles.h"
#include "dbutil.h"

const char* const g_MappingSyslogPrior[8] = {"emerg", "alert", "crit", "err", "warning", "notice", "info", "debug"};

const char* const g_MappingSyslogOP[10] = {"=", "!=", "<", "<=", ">", ">=", "LIKE", "NOT LIKE", "GLOB", "NOT GLOB"};

namespace {

constexpr std::array<const char*, SYSLOG_ATTRI_NONE> kAttributeNames = {
    "id",    "host", "ip",  "fac",   "prio",  "llevel", "tag",   "utcsec", "tzoffset", "ldate",
    "ltime", "prog", "msg", "luser", "event", "isdir",  "fname", "fsize",  "ip"};

}  // namespace

const char* LogAttriStrGet(_SYSLOG_DB_ATTRI_tag attr) {
    return attr >= SYSLOG_ATTRI_ID && attr < SYSLOG_ATTRI_NONE ? kAttributeNames[static_cast<size_t>(attr)] : "";
}

_SYSLOG_DB_ATTRI_tag LogAttriType(std::string name) {
    int32_t value = 0;
    for (const char* candidate : kAttributeNames) {
        if (name == candidate) {
            break;
        }
        ++value;
    }
    return static_cast<_SYSLOG_DB_ATTRI_tag>(value);
}

_SYSLOG_DB_PRIORITY_tag PriorStrToType(const char* name) {
    int32_t value = 0;
    for (const char* candidate : g_MappingSyslogPrior) {
        if (strcmp(quor::OrEmpty(name), candidate) == 0) {
            return static_cast<_SYSLOG_DB_PRIORITY_tag>(value);
        }
        ++value;
    }
    return SYSLOG_PRIORITY_DEBUG;
}

std::string PriorTypeToStr(_SYSLOG_DB_PRIORITY_tag prio) {
    return prio >= SYSLOG_PRIORITY_EMERG && prio <= SYSLOG_PRIORITY_DEBUG ? g_MappingSyslogPrior[prio] : "";
}

std::string TrimUserName(const std::string& text) {
    return text.substr(text.find(':') + 1);  // npos + 1 is 0
}

int DBRecToLogInfo(std::string& table, DBResult_tag* result, unsigned int row, _SYSLOG_LOG_DATA_tag* rec, bool trim) {
    if (table == "logs") {
        return DBRecToAllLogInfo(result, row, rec, trim);
    }
    if (table == "general_log" || table == "connection_log") {
        return DBRecToSysLogInfo(result, row, rec);
    }
    return table == "transfer_log" ? DBRecToXferLogInfo(result, row, rec) : -1;
}

int DBRecToAllLogInfo(DBResult_tag* result, unsigned int row, _SYSLOG_LOG_DATA_tag* rec, bool trim) {
    if (result == nullptr || rec == nullptr) {
        return -1;
    }
    const quor::Row fields(result, row);
    rec->id = quor::ToUint64(fields["id"]);
    rec->host = fields["host"];
    rec->ip = fields["ip"];
    rec->tag = fields["tag"];
    rec->tzoffset = fields["tzoffset"];
    rec->ldate = fields["ldate"];
    rec->ltime = fields["ltime"];
    rec->prog = fields["prog"];
    rec->msg = fields["msg"];
    if (trim) {
        rec->msg = TrimUserName(rec->msg);
    }
    rec->utcsec = quor::ToInt64(fields["utcsec"]);
    rec->fac = fields["fac"];
    rec->prio = PriorStrToType(fields["prio"]);
    return 0;
}

int DBRecToSysLogInfo(DBResult_tag* result, unsigned int row, _SYSLOG_LOG_DATA_tag* rec) {
    if (result == nullptr || rec == nullptr) {
        return -1;
    }
    const quor::Row fields(result, row);
    rec->id = quor::ToUint64(fields["id"]);
    rec->host = fields["host"];
    rec->prio = PriorStrToType(fields["llevel"]);
    rec->prog = fields["prog"];
    rec->ldate = fields["ldate"];
    rec->ltime = fields["ltime"];
    rec->luser = fields["luser"];
    rec->event = fields["msg"];
    return 0;
}

int DBRecToXferLogInfo(DBResult_tag* result, unsigned int row, _SYSLOG_LOG_DATA_tag* rec) {
    if (result == nullptr || rec == nullptr) {
        return -1;
    }
    const quor::Row fields(result, row);
    rec->id = quor::ToUint64(fields["id"]);
    rec->host = fields["host"];
    rec->prog = fields["prog"];
    rec->ldate = fields["ldate"];
    rec->ltime = fields["ltime"];
    rec->luser = fields["luser"];
    rec->event = fields["event"];
    rec->fname = fields["fname"];
    rec->isdir = quor::ToUint64(fields["isdir"]);
    rec->fsize = fields["fsize"];
    rec->xferip = fields["ip"];
    return 0;
}

// What a program of somebody else does: create a log database, write a row, find it again.
#include <quor/quordb.h>
#include <quorsyslog/dbhandler.h>
#include <quorsyslog/dbutil.h>

#include <cstdio>

static int printRow(_SYSLOG_LOG_DATA_tag& record, void* found) {
    ++*static_cast<int*>(found);
    return printf("%s %s\n", record.host.c_str(), record.msg.c_str()) < 0;
}

int main(int argc, char** argv) {
    if (argc != 3) {
        return 2;
    }
    DBHandler handle(argv[1], argv[2]);
    if (handle.DBCon() != 0 ||
        handle.DBExecute("INSERT INTO logs(host, prio, msg) VALUES('router', 'err', 'link down')") != 0) {
        return 2;
    }
    handle.DBDiscon();

    std::string path = argv[1];
    std::list<_SYSLOG_SQL_COND_tag> conds{{SYSLOG_ATTRI_LLEVEL, 0, "err", {}}};
    int found = 0;
    const int status = SyslogDBSelect(path, conds, nullptr, nullptr, printRow, &found, false);
    return status == 0 && found == 1 && QUORDBNumRows(nullptr) == 0 ? 0 : 1;
}

// The module as an extension of the database shell: ".load quorarchive".
#define SQLITE_CORE 1  // the functions themselves, not the shell's table of them
#include <sqlite3ext.h>

#include "platform/archive/table.h"

// A shell that brings an SQLite of its own has other functions than those that are called here.
extern "C" __attribute__((visibility("default"))) int sqlite3_quorarchive_init(sqlite3* db, char** error,
                                                                               const sqlite3_api_routines* shell) {
    if (shell->open_v2 != sqlite3_open_v2) {
        *error = shell->mprintf("this program has an SQLite of its own; use one that is linked to the system's");
        return SQLITE_ERROR;
    }
    return quor::archive::Register(db);
}

// Everything of a log database but its table "logs", copied from one attached database to another.
#ifndef PLATFORM_ARCHIVE_COPYING_H
#define PLATFORM_ARCHIVE_COPYING_H

#include <sqlite3.h>

#include <string>

namespace quor::archive {

// From schema "source" to "main". The definitions of what belongs to logs go to main.logs_schema, and so do triggers.
void CopyForArchive(sqlite3* db);
// The way back, in two steps: before the rows of logs are there, and after.
void CopyTables(sqlite3* db);
void CreateTable(sqlite3* db);
void FinishTable(sqlite3* db);

}  // namespace quor::archive

#endif

/* Saves the rows of a damaged SQLite database into a new one.
 *
 * The file is read by the file format itself, not through SQLite, so that a lost header, a missing end or a bad page
 * costs no more than the rows it held. The damaged file and its "-wal" companion are only read. */
#ifndef QUOR_QUORSALVAGE_H
#define QUOR_QUORSALVAGE_H

#ifdef __cplusplus
extern "C" {
#endif

#pragma GCC visibility push(default)

typedef struct QUORSALVAGETABLE_tag {
    char name[64];
    unsigned long long rows;
} QUORSALVAGETABLE;

typedef struct QUORSALVAGE_tag {
    unsigned long long pages;     /* of the damaged database, its write-ahead log included */
    unsigned long long badPages;  /* pages of a table that are missing or hold something else */
    unsigned long long badRows;   /* rows on readable pages that are broken themselves */
    unsigned long long strayRows; /* saved rows from pages that nothing refers to, deleted ones maybe among them, and of
                                     tables whose definition is damaged: the table that they fit got them */
    unsigned long long duplicates; /* rows left out because a row with their id, or a unique value, was there already */
    unsigned long long unknownRows; /* rows of the same kinds that fit no table */
    int schemaRead;                 /* 1: the tables are those of the damaged file; 0: those of a schema */
    int tableCount;
    QUORSALVAGETABLE tables[16]; /* the first tables of the new database and their rows */
    char error[1024];            /* why it failed, and what to do */
} QUORSALVAGE;

/* Called from time to time with the pages looked at so far; nonzero gives up. */
typedef int (*QUORSALVAGEPROGRESS)(unsigned long long pagesDone, unsigned long long pages, void* context);

/* Creates `fresh`, which must not exist, from what is left of `damaged`. `schemas` is an array of SQL files ended by
 * null, for a file whose own table definitions are lost: the one that its rows fit best is taken. `progress` may be
 * null. 0 on success, also when few rows are left; negative, with `report->error` set and no new file, otherwise. */
int QUORDBSalvage(const char* damaged, const char* fresh, const char* const* schemas, QUORSALVAGEPROGRESS progress,
                  void* context, QUORSALVAGE* report);

#pragma GCC visibility pop

#ifdef __cplusplus
}
#endif

#endif

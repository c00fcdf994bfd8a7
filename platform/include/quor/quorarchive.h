/* Archives of log databases: small, never growing, and read like any other database.
 *
 * An archive is an SQLite file whose table "logs" is kept in compressed blocks. QUORDBConnect() opens it, and all
 * statements that read or delete work on it; rows cannot be added or changed. docs/archives.md describes the file. */
#ifndef QUOR_QUORARCHIVE_H
#define QUOR_QUORARCHIVE_H

#ifdef __cplusplus
extern "C" {
#endif

#pragma GCC visibility push(default)

typedef struct QUORARCHIVE_tag {
    unsigned long long rows;   /* of table logs, in sound blocks */
    unsigned long long blocks; /* damaged ones among them */
    unsigned long long damagedBlocks;
    unsigned long long damagedRows; /* in damaged blocks, as far as that is known */
    unsigned long long bytes;       /* of the file */
    unsigned long long checksum;    /* of all rows, whatever their order */
    long long firstId;              /* 0 when there is no row */
    long long lastId;
    char firstDate[16]; /* smallest and largest ldate; empty when unknown */
    char lastDate[16];
    char error[1024]; /* why it failed, and what to do */
} QUORARCHIVE;

/* Called from time to time with the rows done so far and their number; nonzero gives up. */
typedef int (*QUORARCHIVEPROGRESS)(unsigned long long done, unsigned long long rows, void* context);

/* Every int result: 0 on success; negative, with `report->error` set, otherwise. `progress` and `report` may be null.
 * A new file is written beside its place as "FILE.partial", forced to the disk and then renamed, so that it is whole
 * or not there. Neither may exist: what an earlier try left is to be removed first. */

/* Writes the log database `source` as an archive, reads it back and compares. The source is only read; it may be in
 * use. */
int QUORArchiveWrite(const char* source, const char* archive, QUORARCHIVEPROGRESS progress, void* context,
                     QUORARCHIVE* report);

/* Makes a plain log database of an archive, with everything that was in the one that it was made of. */
int QUORArchiveExtract(const char* archive, const char* fresh, QUORARCHIVE* report);

/* What is known of an archive without reading its rows. */
int QUORArchiveInfo(const char* archive, QUORARCHIVE* report);

/* Reads every row. Fails when blocks are damaged, when the rows are not those that were written, or, unless `source` is
 * null, not those of the log database `source`; the report counts what there is all the same. */
int QUORArchiveCheck(const char* archive, const char* source, QUORARCHIVEPROGRESS progress, void* context,
                     QUORARCHIVE* report);

/* 1 when the file is an archive, else 0. */
int QUORArchiveIs(const char* path);

#pragma GCC visibility pop

#ifdef __cplusplus
}
#endif

#endif

/* Core library: string tables, string lists, section files, files, programs, formatted strings.
 *
 * An int result is negative on failure unless said otherwise. A null or nonsensical argument fails; it never crashes.
 */
#ifndef QUOR_QUORCORE_H
#define QUOR_QUORCORE_H

#ifdef __cplusplus
extern "C" {
#endif

#pragma GCC visibility push(default)

typedef struct QLIBSZHASH_tag QLIBSZHASH; /* a table from string to string, in the order of first insertion */

/* A list of strings, owned by the list. */
typedef struct QLIBSZLIST_tag {
    int count;
    char** items;
} QLIBSZLIST;

/* `size` is a hint of the number of entries; the table grows as needed. Null on failure or for a size below 1. */
QLIBSZHASH* QLIBCSzHashAlloc(int size);
/* Sets or replaces an entry; key and value are copied. */
int QLIBCSzHashSetValue(QLIBSZHASH** hash, const char* key, const char* value);
/* The value, owned by the table until the entry changes; null when there is none. */
const char* QLIBCSzHashGetValue(QLIBSZHASH* hash, const char* key);
void QLIBCSzHashFree(QLIBSZHASH* hash);

QLIBSZLIST* QLIBCSzListAlloc(int size);
void QLIBCSzListFree(QLIBSZLIST* list);

/* Section files: "[name]" headers, key="value" lines (a value without quotes is read too, without the blanks around it;
 * nothing is escaped inside the quotes, the last quote of the line ends the value), "#" and ";" comment lines. Of
 * several sections with one name, and of several lines with one key in a section, the first counts. Lines after a
 * header that is not closed belong to no section; any other line is ignored. Line ends may be CRLF. A
 * file with a zero byte, one above 1 MiB and anything but a regular file cannot be read. */

/* Appends the section names to `*list` in file order. */
int QLIBCFileEnumSection(const char* file, QLIBSZLIST** list);
/* Puts the entries of a section into `*hash`. Negative when the file or the section is missing. */
int QLIBCFileGetSection(const char* file, const char* section, QLIBSZHASH** hash);
/* Writes `hash` as the section, renaming it to `newName`, which no other section may have. Entries keep their places in
 * the section, new ones follow the last, others go; everything else in the file stays as it is, byte for byte. A
 * missing file is created (mode 0644), a new section appended. `lineFormat` is one line with two "%s", for key and
 * value, and no other "%". The file is replaced whole, keeping owner, mode and a symbolic link to it, so a power cut
 * leaves the old or the new one. What would not read back the same (a newline in a value, for instance) is refused and
 * nothing changes. */
int QLIBCFileSetSection(const char* file, const char* section, const char* newName, QLIBSZHASH* hash,
                        const char* lineFormat);
/* Copies the value of the first line with this key, in any section or none, to `out`, truncated to fit. `flags` is not
 * used. */
int QLIBCFileGetKeyValue(const char* file, const char* key, char* out, int outSize, int flags);

/* 1 when the path exists, else 0. */
int QLIBCFileExist(const char* path);

/* Runs a program with the given arguments (char*, at most 62, ended by null), no shell between, and waits for it. It
 * reads from and prints to /dev/null and gets no open file but standard error. The program's exit status, 128 plus the
 * signal that ended it, or negative when it could not be run. A process that ignores SIGCHLD learns no status and gets
 * 0. */
int QLIBCExec(const char* program, ...);

/* A newly allocated formatted text, never null; release it with QLIBCStrPut(), which accepts null. */
char* QLIBCStrGet(const char* format, ...) __attribute__((format(printf, 1, 2)));
void QLIBCStrPut(char* text);

#pragma GCC visibility pop

#ifdef __cplusplus
}
#endif

#endif

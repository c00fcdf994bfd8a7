/* File system. */
#ifndef QUOR_QUORFS_H
#define QUOR_QUORFS_H

#ifdef __cplusplus
extern "C" {
#endif

#pragma GCC visibility push(default)

/* Creates the folder and its missing parents with `mode`, as the umask allows. The second and third argument are not
 * used; `uid` and `gid` become the owner of created folders where they are not -1. 0 also when the folder exists,
 * negative otherwise. */
int QUORFSMkdirP(const char* path, int reserved1, int reserved2, int uid, int gid, unsigned int mode);

#pragma GCC visibility pop

#ifdef __cplusplus
}
#endif

#endif

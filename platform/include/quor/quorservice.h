/* Service control. */
#ifndef QUOR_QUORSERVICE_H
#define QUOR_QUORSERVICE_H

#ifdef __cplusplus
extern "C" {
#endif

#pragma GCC visibility push(default)

/* Makes a running service reload: a HUP to the process that its pid file below /run names, else the service manager's
 * own reload. 0 when either was done; negative otherwise, and for a name of other than letters, digits and "@._:-". */
int QLIBServiceReload(const char* service);
/* The same for a job of a package. */
int QLIBServicectlJobReload(const char* job);

#pragma GCC visibility pop

#ifdef __cplusplus
}
#endif

#endif

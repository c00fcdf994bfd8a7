/* Notification service: templates, filter, delivery; and the settings of its channels in /etc/quorinfo.conf. */
#ifndef QUOR_QUORNOTIFY_H
#define QUOR_QUORNOTIFY_H

#include "quorcore.h"

#ifdef __cplusplus
extern "C" {
#endif

#pragma GCC visibility push(default)

/* Renders the template "<textsDir>/<tag>.txt" with the values of the table, applies the filter file, and hands the
 * notice to the configured channels. Delivery goes on in processes of its own, one for each channel: the call never
 * waits for a server, and 0 says that the notice was accepted (or held back by the filter or a full queue, and
 * counted), not that it arrived. A delivery that fails is tried again, 16 times within 16 hours, with the next notice
 * or QUORNotifyResume() after its wait.
 * "%SYSLOG_CONTENT%" is taken as escaped for JSON and shown as it was before. `flags` is not used. Negative for a
 * template that is missing or has no subject, and when delivery cannot be started. The caller forks: it should have no
 * other threads. */
int QUORSysNotifySendNotificationCustomized(const char* tag, const char* textsDir, const char* filterFile,
                                            QLIBSZHASH* values, int flags);

typedef struct QUORMAIL_tag {
    char server[256];     /* host name or address of the SMTP server */
    char recipient[1024]; /* one or more addresses, separated by commas */
    char sender[256];
    char user[256]; /* empty: no login */
    char password[256];
    int port;
    int security;     /* 0 none, 1 STARTTLS, 2 TLS from the start */
    char caFile[256]; /* certificates that the server's is checked against; empty: the system's */
    int verify;       /* 0: any certificate will do */
} QUORMAIL;

/* Delivers a test notice to the desktop, each webhook, the command and the mail server, past the filter and the queue,
 * and waits for each. `report` hears of each: the channel's name, with a number where there are several ("webhook 2":
 * in the order of the settings), 1 or 0, and the cause of a failure with what to do about it (else empty). Their
 * number, negative when the settings cannot be read. */
int QUORNotifyTest(void (*report)(const char* channel, int ok, const char* detail, void* context), void* context);

/* Starts the deliveries whose time to be tried again has come. To be called every few seconds by a process that is
 * always there, so that they also go on after a restart. Negative when the spool cannot be used. */
int QUORNotifyResume(void);

/* Hands over the notices that were given up since the last call: a channel, the subject of the notice, and the cause of
 * the last failure, each one line of UTF-8. One process should ask. The number of notices, negative when the spool
 * cannot be used. */
int QUORNotifyGivenUp(void (*report)(const char* channel, const char* subject, const char* cause, void* context),
                      void* context);

/* Fills `mail` from the settings; a key that is absent leaves its default. Negative when they cannot be read. */
int QUORMailGet(QUORMAIL* mail);

typedef struct QUORSMSCONF_tag {
    int enabled;
} QUORSMSCONF;

/* The SMS settings, null when they cannot be read. Release with QUORSmsConfFree(), which accepts null. */
QUORSMSCONF* QUORSmsConfGet(void);
void QUORSmsConfFree(QUORSMSCONF* conf);

#pragma GCC visibility pop

#ifdef __cplusplus
}
#endif

#endif

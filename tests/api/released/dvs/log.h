/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVS_LOG_H
#define DVS_LOG_H

#ifdef __cplusplus
extern "C" {
#endif

/*
 * Where messages go. Every message goes to its stated stream by default (standard output, standard error or the
 * host's log); with a sink set it goes there instead, whole, one call a message.
 *
 * sink   called with the level the message prints at (-1 for a message that no level guards), the text exactly as it
 *        would be printed, line end included, and `arg`. It must not call back into the library, and `text` is lent
 *        for the call only. NULL restores the default streams.
 * arg    kept and passed on; never looked at.
 *
 * Takes a lock of its own for the exchange only: set the sink before other threads use the library, or accept that a
 * message in flight still reaches the old one.
 */
typedef void (*DVSLogSink)(int level, const char *text, void *arg);
void DVSLog_SetSink(DVSLogSink sink, void *arg);

#ifdef __cplusplus
}
#endif

#endif

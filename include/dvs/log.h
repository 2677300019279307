/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVS_LOG_H
#define DVS_LOG_H

#ifdef __cplusplus
extern "C" {
#endif

/*
 * Where messages go. By default every message goes to its own stream: standard output, standard error or the host's
 * log. If a sink is set, it receives all messages instead, one call per whole message.
 *
 * sink   called with the message's level (-1 for a message that no level guards), the text exactly as it would be
 *        printed, including the newline, and `arg`. It must not call back into the library. `text` is valid only
 *        during the call. NULL restores the default streams.
 * arg    passed to the sink unchanged.
 *
 * Takes its own lock, only for the exchange. Set the sink before other threads use the library; otherwise a message
 * in flight may still reach the old sink.
 */
typedef void (*DVSLogSink)(int level, const char *text, void *arg);
void DVSLog_SetSink(DVSLogSink sink, void *arg);

#ifdef __cplusplus
}
#endif

#endif

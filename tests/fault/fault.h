/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_FAULT_FAULT_H
#define TESTS_FAULT_FAULT_H

/*
 * Run-time control of the fault interposer. A program has these functions when it is linked with dvs_fault,
 * or when libdvsfault.so is preloaded into it (look them up with dlsym then). tests/fault/README.md describes
 * plans, kinds and what can be reached in which build; tests/fault/sweep.h is the usual way to use this from
 * a test.
 *
 * All functions may be called from any thread. None allocates.
 */

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/*
 * Arms the faults of `plan`, replaces those armed before, and resets all counts. The text has the format of the
 * environment variable DVS_FAULT. Returns 0, or -1 with nothing armed if the plan does not parse.
 */
int fault_arm(const char *plan);

/* Disarms all faults. Counts stay readable. */
void fault_disarm(void);

/* Calls of a kind ("write", "alloc", …) since the last fault_arm, without suspended ones; -1 for an unknown
 * kind. */
int64_t fault_calls(const char *kind);

/* Faults delivered since the last fault_arm. */
int64_t fault_hits(void);

/* Live heap blocks of the whole process. */
int64_t fault_live_blocks(void);

/* While suspended, the calling thread's calls neither count nor fail. Nests. */
void fault_suspend(void);
void fault_resume(void);

#ifdef __cplusplus
}
#endif

#endif

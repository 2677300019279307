/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVS_DVS_H
#define DVS_DVS_H

/* The whole exported interface. */

#include "dvs/configstore.h"
#include "dvs/data.h"
#include "dvs/file.h"
#include "dvs/hyp.h"
#include "dvs/log.h"
#include "dvs/state.h"
#include "dvs/status.h"

#endif

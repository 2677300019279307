/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_FAKE_STORE_H
#define TESTS_CONFIGSTORE_FAKE_STORE_H

// An in-memory double of platform/configstore.h for tests of the layers above it. It follows the contract,
// has no schema and no limits, counts its calls, fails calls on request, and lets tests read its content.
// There is one store per process, with both layers. A transaction is a copy, discarded on cancel or when its
// handle is destroyed.
//
// A program that links the target fake_store uses it in place of the platform's store.

#include <cstdint>
#include <string>

#include "platform/configstore.h"

namespace fake_store {

/// Empties the store and resets faults and counts. Open handles stay valid.
void Reset();

/// The committed content of both layers as text: one line per value or object, in order.
std::string Dump();
/// The same for one object that is not in the store (or not yet).
std::string Dump(const configstore::Object *object);

/// The number of calls so far to functions that return a status.
int Calls();
/// Name of the `n`-th call, counted from 1.
std::string CallName(int n);

/// Makes the `n`-th call from now on (1 is the next) fail with `status` and unchanged outputs. 0 disarms it.
void FailCall(int n, int32_t status = configstore::FAILED);
/// Makes every later call of this function fail; null disarms it.
void FailFunction(const char *name, int32_t status = configstore::FAILED);
/// Returns whether an armed failure has occurred.
bool Failed();

/// Makes GetStore report success without a store.
void GiveNoStore(bool none);

/// Destroys the store handle that GetStore returned last, if it is still open. For tests of saves that keep
/// it.
void DestroyKeptStore();

/// The number of unreleased handles: stores, objects, filter specs, arrays, texts.
int OpenHandles();

} // namespace fake_store

#endif

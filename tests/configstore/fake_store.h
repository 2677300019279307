/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_FAKE_STORE_H
#define TESTS_CONFIGSTORE_FAKE_STORE_H

// An in-memory double of platform/configstore.h for tests of what stands above it. It follows the contract
// but knows no schema and no limits, counts its calls, fails the one it is told to, and can be looked into.
// One store per process, with both layers; a transaction is a copy, dropped when its handle is destroyed or
// it is cancelled.
//
// A program that links the target fake_store uses it in place of the platform's store.

#include <cstdint>
#include <string>

#include "platform/configstore.h"

namespace fake_store {

/// Empties the store and forgets faults and counts. Handles that are still open stay valid.
void Reset();

/// What is committed, as text: one line a value or object, in order, both layers.
std::string Dump();
/// The same for one object that is not in the store (or not yet).
std::string Dump(const configstore::Object *object);

/// Calls so far of functions that return a status.
int Calls();
/// Name of the `n`-th call, counted from 1.
std::string CallName(int n);

/// Lets the `n`-th call from here on (1 is the next) fail with `status`, its outputs untouched. 0 takes it
/// back.
void FailCall(int n, int32_t status = configstore::FAILED);
/// Lets every call of this function fail from here on; null takes it back.
void FailFunction(const char *name, int32_t status = configstore::FAILED);
/// Whether the call that was to fail has been made.
bool Failed();

/// Lets GetStore report success without a store.
void GiveNoStore(bool none);

/// Destroys the store handle that GetStore gave out last, if it is still open: for tests of saves that keep it.
void DestroyKeptStore();

/// Everything handed out and not yet given back: stores, objects, filter specs, arrays, texts.
int OpenHandles();

} // namespace fake_store

#endif

/* SPDX-License-Identifier: Apache-2.0 */
// Text services of the embedded runtime (platform/runtime.h): formatted blocks, the checked copy, error
// texts.

#include "platform/runtime.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>

extern "C" char *Str_SafeAsprintf(size_t *length, const char *format, ...) {
    va_list args;
    va_start(args, format);
    va_list again;
    va_copy(again, args);
    const int needed = std::vsnprintf(nullptr, 0, format, args);
    va_end(args);
    char *text = nullptr;
    if (needed >= 0) {
        const std::size_t size = static_cast<std::size_t>(needed) + 1;
        text = static_cast<char *>(std::malloc(size));
        if (text) {
            std::vsnprintf(text, size, format, again);
            if (length) *length = size - 1;
        }
    }
    va_end(again);
    return text;
}

extern "C" char *Str_Strcpy(char *dst, const char *src, size_t size) {
    const std::size_t len = std::strlen(src);
    if (len >= size) {
        std::fprintf(stderr, "text of %zu characters does not fit into %zu bytes: \"%.64s\"\n", len, size,
                     src);
        std::abort();
    }
    std::memcpy(dst, src, len + 1);
    return dst;
}

extern "C" const char *Err_Errno2String(int error) {
    // strerror may share one buffer between all threads; the descriptions are constants.
    if (const char *text = strerrordesc_np(error)) return text;
    thread_local char unknown[32];
    std::snprintf(unknown, sizeof unknown, "Unknown error %d", error);
    return unknown;
}

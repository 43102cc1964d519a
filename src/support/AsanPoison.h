#pragma once

// Marks memory that a pool keeps but nobody owns, so that AddressSanitizer still reports a use
// after free of it; nothing without the sanitizer.
#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/asan_interface.h>
#define QEN_POISON(p, n) ASAN_POISON_MEMORY_REGION(p, n)
#define QEN_UNPOISON(p, n) ASAN_UNPOISON_MEMORY_REGION(p, n)
#else
#define QEN_POISON(p, n) ((void)(p), (void)(n))
#define QEN_UNPOISON(p, n) ((void)(p), (void)(n))
#endif

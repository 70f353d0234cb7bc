#include <services/rtprim.h>

#include <locale.h>
#include <stdarg.h>
#include <stdint.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#if defined(__linux__)
#include <sys/mman.h>
#include <unistd.h>
#endif
#include <atomic>
#include <charconv>

namespace {

// Callers never test for null, so running out of memory ends the process here
// with a message instead of a crash somewhere far away.
[[noreturn]] void OutOfMemory(size_t size) {
    fprintf(stderr, "dwxservices: out of memory (failed to allocate %zu bytes)\n", size);
    fflush(stderr);
    abort();
}

// A ring of growing text buffers per thread. The ring itself is trivially
// destructible, so MkName stays usable in exit callbacks that run after the
// thread's destructors; RingRelease gives the buffers back when the thread ends.
struct NameRing {
    static constexpr int kSlots = 32;
    char* text[kSlots];
    size_t capacity[kSlots];
    int next;
};

thread_local NameRing nameRing;

struct RingRelease {
    ~RingRelease() {
        for (int i = 0; i < NameRing::kSlots; ++i) {
            free(nameRing.text[i]);
            nameRing.text[i] = nullptr;
            nameRing.capacity[i] = 0;
        }
    }
};
thread_local RingRelease ringRelease;

// Takes the next slot of the ring and returns its index.
int TakeSlot() {
    (void)&ringRelease;  // odr-use: makes sure the release runs at thread exit
    int slot = nameRing.next;
    nameRing.next = (slot + 1) % NameRing::kSlots;
    return slot;
}

// The buffer of `slot`, grown to at least `size` bytes (contents not kept).
char* Reserve(int slot, size_t size) {
    NameRing& ring = nameRing;
    if (ring.capacity[slot] < size) {
        size_t capacity = ring.capacity[slot] ? ring.capacity[slot] : 64;
        while (capacity < size) {
            capacity *= 2;
        }
        free(ring.text[slot]);
        ring.text[slot] = static_cast<char*>(HMalloc(capacity));
        ring.capacity[slot] = capacity;
    }
    return ring.text[slot];
}

std::atomic<RTMessageCatalogue> messageCatalogue{nullptr};

}  // namespace

void* HMalloc(size_t size) {
    void* block = malloc(size ? size : 1);
    if (!block) {
        OutOfMemory(size);
    }
    return block;
}

void* HCalloc(size_t a, size_t b) {
    if (b && a > static_cast<size_t>(-1) / b) {
        OutOfMemory(static_cast<size_t>(-1));
    }
    size_t size = a * b;
    void* block = calloc(size ? size : 1, 1);
    if (!block) {
        OutOfMemory(size);
    }
    return block;
}

void* HRealloc(void* block, size_t size) {
    // realloc with size 0 may free the block and return null; keep a valid block instead.
    void* moved = realloc(block, size ? size : 1);
    if (!moved) {
        OutOfMemory(size);
    }
    return moved;
}

void HPrefault(void* block, size_t size) {
#if defined(__linux__) && defined(MADV_POPULATE_WRITE)
    // Whole pages only: madvise wants a page-aligned start, and the pages at
    // either end, shared with other blocks, fault in as usual.
    static const uintptr_t kPage = static_cast<uintptr_t>(sysconf(_SC_PAGESIZE));
    const uintptr_t start = (reinterpret_cast<uintptr_t>(block) + kPage - 1) & ~(kPage - 1);
    const uintptr_t end = (reinterpret_cast<uintptr_t>(block) + size) & ~(kPage - 1);
    if (end > start) {
        // A kernel without the call (before Linux 5.14) says EINVAL; the
        // pages are then faulted in as they are written, as without it.
        (void)madvise(static_cast<char*>(block) + (start - reinterpret_cast<uintptr_t>(block)),
                      end - start, MADV_POPULATE_WRITE);
    }
#else
    (void)block;
    (void)size;
#endif
}

char* HString(const char* text) {
    if (!text) {
        return nullptr;
    }
    // Every stored name and value is one of these: malloc directly, without
    // the call through HMalloc.
    size_t size = strlen(text) + 1;
    char* copy = static_cast<char*>(malloc(size));
    if (!copy) {
        OutOfMemory(size);
    }
    memcpy(copy, text, size);
    return copy;
}

char* MkName(const char* format, ...) {
    if (!format) {
        format = "";
    }
    va_list args;
    va_start(args, format);
    va_list retry;
    va_copy(retry, args);
    int slot = TakeSlot();
    char* text = Reserve(slot, 64);
    size_t capacity = nameRing.capacity[slot];
    int length = vsnprintf(text, capacity, format, args);
    va_end(args);
    if (length < 0) {
        text[0] = '\0';
    } else if (static_cast<size_t>(length) >= capacity) {
        text = Reserve(slot, static_cast<size_t>(length) + 1);
        vsnprintf(text, static_cast<size_t>(length) + 1, format, retry);
    }
    va_end(retry);
    return text;
}

char* MkName(double value, int digits) {
    if (digits >= 0) {
        // "%.*f" with a point whatever the locale: a sign, up to 309 digits
        // before the point, the point, `digits` after it and the NUL.
        size_t size = 312 + static_cast<size_t>(digits);
        char* text = Reserve(TakeSlot(), size);
        std::to_chars_result result =
            std::to_chars(text, text + size - 1, value, std::chars_format::fixed, digits);
        *result.ptr = '\0';
        return text;
    }
    // Shortest text that reads back to the same double; 32 bytes hold any of them.
    char* text = Reserve(TakeSlot(), 32);
    std::to_chars_result result = std::to_chars(text, text + 31, value);
    *result.ptr = '\0';
    return text;
}

const char* _(const char* message) {
    if (!message) {
        return "";
    }
    RTMessageCatalogue catalogue = messageCatalogue.load(std::memory_order_acquire);
    if (catalogue) {
        const char* translation = catalogue(message);
        if (translation) {
            return translation;
        }
    }
    return message;
}

RTMessageCatalogue RTSetMessageCatalogue(RTMessageCatalogue catalogue) {
    return messageCatalogue.exchange(catalogue, std::memory_order_acq_rel);
}

char* UCaseString(char* text) {
    if (text) {
        for (char* p = text; *p; ++p) {
            if (*p >= 'a' && *p <= 'z') {
                *p = static_cast<char>(*p - 'a' + 'A');
            }
        }
    }
    return text;
}

char* LCaseString(char* text) {
    if (text) {
        for (char* p = text; *p; ++p) {
            if (*p >= 'A' && *p <= 'Z') {
                *p = static_cast<char>(*p - 'A' + 'a');
            }
        }
    }
    return text;
}

namespace {

// The "C" locale, made once and kept for the life of the process, so that
// number reading never follows the host's setlocale.
#if defined(_WIN32)
_locale_t CLocale() {
    static const _locale_t c = _create_locale(LC_ALL, "C");
    return c;
}
#define DWX_STRTOD_L _strtod_l
#define DWX_STRTOL_L _strtol_l
#define DWX_STRTOLL_L _strtoi64_l
#else
locale_t CLocale() {
    static const locale_t c = newlocale(LC_ALL_MASK, "C", static_cast<locale_t>(nullptr));
    return c;
}
#define DWX_STRTOD_L strtod_l
#define DWX_STRTOL_L strtol_l
#define DWX_STRTOLL_L strtoll_l
#endif

const char* OrEmpty(const char* text) {
    return text ? text : "";
}

}  // namespace

double TZN_strtod(const char* text, char** end) {
    return DWX_STRTOD_L(OrEmpty(text), end, CLocale());
}

long TZN_strtol(const char* text, char** end, int base) {
    return DWX_STRTOL_L(OrEmpty(text), end, base, CLocale());
}

long long TZN_strtoll(const char* text, char** end, int base) {
    return DWX_STRTOLL_L(OrEmpty(text), end, base, CLocale());
}

double TZN_atof(const char* text) {
    return TZN_strtod(text, nullptr);
}

int TZN_atoi(const char* text) {
    return static_cast<int>(TZN_strtol(text, nullptr, 10));
}

double ScanDouble(const char* text, int length) {
    if (!text || length <= 0) {
        return 0.0;
    }
    // strtod reads until the number ends, which may lie past `length`; it
    // therefore works on a terminated copy of just those characters.
    size_t size = strnlen(text, static_cast<size_t>(length));
    char small[128];
    char* copy = size < sizeof small ? small : static_cast<char*>(HMalloc(size + 1));
    memcpy(copy, text, size);
    copy[size] = '\0';
    double value = TZN_strtod(copy, nullptr);
    if (copy != small) {
        free(copy);
    }
    return value;
}

void TZN_qsort(void* base, size_t count, size_t size, int (*compare)(const void*, const void*)) {
    if (!base || count < 2 || size == 0 || !compare) {
        return;
    }
    qsort(base, count, size, compare);
}

// The node pool: parse tree nodes carved from slabs, one slab at a time per
// thread.
//
// Each block is preceded by one word that names its slab (null for a block
// that has a heap block of its own), so a node is given back without any
// search. A slab counts the blocks that are still out; the thread that carves
// from it holds one large extra count (kOpen) until the slab is full, and
// whoever brings the count to zero, the carving thread or the thread that
// deletes the last node, frees the slab. Blocks are never reused within a
// slab, so a slab lives exactly as long as its longest-lived node, and memory
// of deleted trees goes back to the C heap at once. Carving takes no atomic
// operation; giving back takes one.
#include "internal/dwxparse_pool.h"

#include <services/rtprim.h>

#include <stdint.h>
#include <stdlib.h>

#include <atomic>
#include <new>

#if defined(__SANITIZE_ADDRESS__)
#define DWXPOOL_ASAN 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define DWXPOOL_ASAN 1
#endif
#endif
#if defined(DWXPOOL_ASAN)
#include <sanitizer/asan_interface.h>
#endif

// Debug builds only: the requests cost a few instructions per block even
// outside valgrind.
#if !defined(NDEBUG) && defined(__has_include)
#if __has_include(<valgrind/memcheck.h>)
#include <valgrind/memcheck.h>
#define DWXPOOL_VALGRIND 1
#endif
#endif

namespace dwxcore::internal {
namespace {

constexpr size_t kAlign = 16;
constexpr size_t kWord = sizeof(void*);
// Below glibc's mmap threshold, so slabs come from the ordinary heap, and a
// little short of 64 KB to leave room for the allocator's own header.
constexpr size_t kSlabBytes = 64 * 1024 - 64;
// Larger nodes (a host's subclass with big members) get a heap block.
constexpr size_t kLargest = 1024;
constexpr intptr_t kOpen = intptr_t(1) << 40;

struct Slab {
    // Blocks out, plus kOpen while a thread carves from the slab.
    std::atomic<intptr_t> nLive;
    // Carving state, used by the carving thread alone.
    char* pcNext;  // where the next block's slab word goes
    char* pcEnd;
    intptr_t nHanded;
};

// The first slab word sits one word below a 16-byte boundary, so that every
// block (the step between blocks is a multiple of 16) is aligned.
constexpr size_t kFirstWord = ((sizeof(Slab) + kWord + kAlign - 1) / kAlign) * kAlign - kWord;

// Marks a block as handed out or given back for the memory checkers, so that
// a use after delete is caught inside a slab as it is on the heap.
void MarkHanded(void* block, size_t size) {
#if defined(DWXPOOL_ASAN)
    ASAN_UNPOISON_MEMORY_REGION(block, size);
#endif
#if defined(DWXPOOL_VALGRIND)
    VALGRIND_MALLOCLIKE_BLOCK(block, size, 0, 0);
#endif
    (void)block;
    (void)size;
}

void MarkGivenBack(void* block, size_t size) {
#if defined(DWXPOOL_ASAN)
    ASAN_POISON_MEMORY_REGION(block, size);
#endif
#if defined(DWXPOOL_VALGRIND)
    VALGRIND_FREELIKE_BLOCK(block, 0);
#endif
    (void)block;
    (void)size;
}

void FreeSlab(Slab* slab) {
#if defined(DWXPOOL_ASAN)
    ASAN_UNPOISON_MEMORY_REGION(slab, kSlabBytes);
#endif
    slab->~Slab();
    free(slab);
}

// The carving thread lets go of a slab: only the blocks still out keep it.
void Close(Slab* slab) {
    const intptr_t drop = kOpen - slab->nHanded;
    if (slab->nLive.fetch_sub(drop, std::memory_order_acq_rel) == drop) {
        FreeSlab(slab);
    }
}

// `prefault` asks for the slab's pages in one call: a thread that has filled
// a slab is building a large tree and will fill this one too, and one call
// costs less than the sixteen page faults it replaces (on the bench tree, a
// read of 78 ms took 72 ms with it). A thread's first slab is left to fault
// page by page, so a host that makes a few nodes holds no more than it writes.
Slab* OpenSlab(bool prefault) {
    void* memory = malloc(kSlabBytes);
    if (memory == nullptr) {
        return nullptr;
    }
    if (prefault) {
        HPrefault(memory, kSlabBytes);
    }
    Slab* slab = new (memory) Slab;
    slab->nLive.store(kOpen, std::memory_order_relaxed);
    slab->pcNext = static_cast<char*>(memory) + kFirstWord;
    slab->pcEnd = static_cast<char*>(memory) + kSlabBytes;
    slab->nHanded = 0;
#if defined(DWXPOOL_ASAN)
    ASAN_POISON_MEMORY_REGION(slab->pcNext, static_cast<size_t>(slab->pcEnd - slab->pcNext));
#endif
    return slab;
}

// The slab this thread carves from, in plain thread-local data that is
// reached without a guard. When the thread ends, the slab is let go; a node
// created later on the thread (from another thread-local destructor) gets a
// heap block of its own.
struct Carver {
    Slab* poSlab;
    bool bGone;
};
#if defined(__GNUC__) && defined(__ELF__)
// The library is loaded with the program, so its few bytes of thread-local
// data can sit in the static block, reached without a call.
__attribute__((tls_model("initial-exec")))
#endif
thread_local Carver tCarver = {nullptr, false};

// Registered on a thread when it opens its first slab; lets go of the slab
// when the thread ends.
struct CarverCloser {
    ~CarverCloser() {
        if (tCarver.poSlab != nullptr) {
            Close(tCarver.poSlab);
            tCarver.poSlab = nullptr;
        }
        tCarver.bGone = true;
    }
};
thread_local CarverCloser tCarverCloser;

void* AllocateAlone(size_t size) {
    char* memory = static_cast<char*>(malloc(size + kAlign));
    if (memory == nullptr) {
        return nullptr;
    }
    *reinterpret_cast<Slab**>(memory + kAlign - kWord) = nullptr;
    return memory + kAlign;
}

}  // namespace

void* Allocate(size_t size) noexcept {
    Carver& carver = tCarver;
    if (size > kLargest || carver.bGone) {
        return AllocateAlone(size);
    }
    // The slab word and the block, rounded so that the next block is aligned too.
    const size_t step = (size + kWord + kAlign - 1) & ~(kAlign - 1);
    Slab* slab = carver.poSlab;
    if (slab == nullptr || static_cast<size_t>(slab->pcEnd - slab->pcNext) < step) {
        Slab* fresh = OpenSlab(slab != nullptr);
        if (fresh == nullptr) {
            return nullptr;
        }
        if (slab != nullptr) {
            Close(slab);
        } else {
            (void)&tCarverCloser;  // the thread's first slab: close it at exit
        }
        carver.poSlab = slab = fresh;
    }
    char* word = slab->pcNext;
    slab->pcNext += step;
    ++slab->nHanded;
#if defined(DWXPOOL_ASAN)
    ASAN_UNPOISON_MEMORY_REGION(word, kWord);
#endif
    *reinterpret_cast<Slab**>(word) = slab;
    void* block = word + kWord;
    MarkHanded(block, step - kWord);
    return block;
}

void Release(void* block, size_t size) noexcept {
    if (block == nullptr) {
        return;
    }
    char* word = static_cast<char*>(block) - kWord;
    Slab* slab = *reinterpret_cast<Slab**>(word);
    if (slab == nullptr) {
        free(static_cast<char*>(block) - kAlign);
        return;
    }
    MarkGivenBack(block, size);
    if (slab->nLive.fetch_sub(1, std::memory_order_acq_rel) == 1) {
        FreeSlab(slab);
    }
}

}  // namespace dwxcore::internal

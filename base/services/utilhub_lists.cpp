// String lists: building, copying, tokenizing and converting to and from text.
#include <services/utilhub.h>

#include "internal/utilhub_internal.h"

#include <stdlib.h>
#include <string.h>

using dwxservices::internal::IsWhite;
using dwxservices::internal::LineAt;
using dwxservices::internal::StartsWithBom;

namespace {

// Builds a string list in place; the entries pushed become the list's.
//
// A list carries nothing but its entries and terminator: hosts build and edit
// lists themselves, so the builder never trusts memory past the terminator.
// Within one call it knows its own capacity and grows by doubling; the spare
// slots left after the terminator are never read again.
class ListBuilder {
  public:
    ListBuilder() = default;

    // Continues an existing list (null starts a new one): O(n) to find its end.
    explicit ListBuilder(char** list) : items(list) {
        if (!list) {
            return;
        }
        while (list[count]) {
            ++count;
        }
        capacity = count + 1;  // only the slots known to exist
    }

    ListBuilder(const ListBuilder&) = delete;
    ListBuilder& operator=(const ListBuilder&) = delete;

    size_t Count() const { return count; }
    char* At(size_t index) const { return items[index]; }

    // Room for `more` further entries and the terminator, in one step.
    void Reserve(size_t more) {
        if (count + more + 1 > capacity) {
            Grow(count + more + 1);
        }
    }

    void Push(char* entry) {
        if (count + 2 > capacity) {
            Grow(capacity < kMinimumSlots ? kMinimumSlots : capacity * 2);
        }
        items[count++] = entry;
    }

    void PushCopy(const char* begin, size_t length) {
        char* entry = static_cast<char*>(HMalloc(length + 1));
        memcpy(entry, begin, length);
        entry[length] = '\0';
        Push(entry);
    }

    // Terminates the list and hands it over.
    char** Finish() {
        Reserve(0);
        items[count] = nullptr;
        return items;
    }

  private:
    static constexpr size_t kMinimumSlots = 4;

    void Grow(size_t slots) {
        if (slots < count + 2) {
            slots = count + 2;
        }
        items = static_cast<char**>(HRealloc(items, slots * sizeof(char*)));
        capacity = slots;
    }

    char** items = nullptr;
    size_t count = 0;
    size_t capacity = 0;
};

// One entry per line of `length` bytes at `text` (rules of LineAt); a
// leading UTF-8 byte order mark is skipped.
char** SplitLines(const char* text, size_t length) {
    ListBuilder lines;
    const char* end = text + length;
    if (StartsWithBom(text, length)) {
        text += 3;
    }
    while (text < end) {
        size_t lineLength;
        const char* next = LineAt(text, end, &lineLength);
        lines.PushCopy(text, lineLength);
        text = next;
    }
    return lines.Finish();
}

}  // namespace

char** Tokenize(const char* text) {
    ListBuilder tokens;
    const unsigned char* p = reinterpret_cast<const unsigned char*>(text ? text : "");
    for (;;) {
        while (IsWhite(*p)) {
            ++p;
        }
        if (!*p) {
            break;
        }
        const unsigned char* start = p;
        bool quoted = false;
        for (; *p && (quoted || !IsWhite(*p)); ++p) {
            if (*p == '"') {
                quoted = !quoted;
            }
        }
        tokens.PushCopy(reinterpret_cast<const char*>(start), static_cast<size_t>(p - start));
    }
    return tokens.Finish();
}

char** TokenizeDelim(const char* text, const char* delimiters) {
    bool isDelimiter[256] = {};
    for (const unsigned char* d =
             reinterpret_cast<const unsigned char*>(delimiters ? delimiters : "");
         *d; ++d) {
        isDelimiter[*d] = true;
    }
    ListBuilder pieces;
    const unsigned char* p = reinterpret_cast<const unsigned char*>(text ? text : "");
    while (*p) {
        const unsigned char* start = p;
        while (*p && !isDelimiter[*p]) {
            ++p;
        }
        if (p > start) {
            pieces.PushCopy(reinterpret_cast<const char*>(start), static_cast<size_t>(p - start));
        }
        if (*p) {
            ++p;
        }
    }
    return pieces.Finish();
}

int CountStringList(char* const* list) {
    int count = 0;
    if (list) {
        while (list[count]) {
            ++count;
        }
    }
    return count;
}

void DestroyStringList(char** list) {
    if (!list) {
        return;
    }
    for (char** entry = list; *entry; ++entry) {
        free(*entry);
    }
    free(list);
}

char** DuplicateStringList(char* const* list) {
    if (!list) {
        return nullptr;
    }
    ListBuilder copy;
    for (; *list; ++list) {
        copy.Push(HString(*list));
    }
    return copy.Finish();
}

char** AddStringToList(char** list, const char* text) {
    ListBuilder builder(list);
    builder.Reserve(1);  // exactly one more slot: the allocator often grows in place
    builder.Push(HString(text ? text : ""));
    return builder.Finish();
}

char** AddStringList(char** list, char* const* other) {
    ListBuilder builder(list);
    if (other && other == list) {
        // Appending a list to itself: copy the entries that were there before.
        size_t count = builder.Count();
        builder.Reserve(count);
        for (size_t i = 0; i < count; ++i) {
            builder.Push(HString(builder.At(i)));
        }
    } else if (other) {
        builder.Reserve(static_cast<size_t>(CountStringList(other)));
        for (; *other; ++other) {
            builder.Push(HString(*other));
        }
    }
    return builder.Finish();
}

char** BufferToStringList(const char* buffer) {
    if (!buffer) {
        return nullptr;
    }
    return SplitLines(buffer, strlen(buffer));
}

char** TextFileToStringList(const char* path) {
    TextLineReader reader;
    if (!reader.OpenFile(path)) {
        return nullptr;
    }
    ListBuilder lines;
    size_t length;
    while (const char* line = reader.Next(&length)) {
        lines.PushCopy(line, length);
    }
    char** list = lines.Finish();
    if (reader.Failed()) {
        DestroyStringList(list);
        return nullptr;
    }
    return list;
}

char* StringListToBuffer(char* const* list) {
    size_t total = 1;
    int count = CountStringList(list);
    size_t* lengths = static_cast<size_t*>(HMalloc(static_cast<size_t>(count) * sizeof(size_t)));
    for (int i = 0; i < count; ++i) {
        lengths[i] = strlen(list[i]);
        total += lengths[i] + 1;
    }
    char* buffer = static_cast<char*>(HMalloc(total));
    char* out = buffer;
    for (int i = 0; i < count; ++i) {
        memcpy(out, list[i], lengths[i]);
        out += lengths[i];
        *out++ = '\n';
    }
    *out = '\0';
    free(lengths);
    return buffer;
}

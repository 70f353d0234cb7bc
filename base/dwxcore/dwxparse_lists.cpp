// The list leaves: a string list and three numeric arrays.
#include <dwxcore/dwxparse.h>

#include <services/rtprim.h>
#include <services/utilhub.h>

#include <limits.h>
#include <math.h>
#include <stdlib.h>
#include <string.h>

#include <string>

#include "internal/dwxparse_numbers.h"
#include "internal/dwxparse_token.h"

namespace {

using namespace dwxcore::internal;

// A new heap copy of `count` elements, or null for an empty list (a count
// below 1 or no source array).
template <class T>
T* CopyElements(int count, const T* values) {
    if (count < 1 || values == nullptr) {
        return nullptr;
    }
    T* copy = static_cast<T*>(HMalloc(sizeof(T) * static_cast<size_t>(count)));
    memcpy(copy, values, sizeof(T) * static_cast<size_t>(count));
    return copy;
}

// Replaces count and array with copies of the given ones; an empty or absent
// source leaves count 0 and a null array.
template <class T>
void ReplaceElements(int& count, T*& values, int newCount, const T* newValues) {
    T* copy = CopyElements(newCount, newValues);  // first: the source may be our own array
    free(values);
    values = copy;
    count = copy != nullptr ? newCount : 0;
}

// Splits the text into white-space separated words and converts each with
// `convert`; a word that is no number gives 0 and still counts.
template <class T, class Convert>
void ParseElements(const char* text, int& count, T*& values, Convert convert) {
    char** words = Tokenize(text != nullptr ? text : "");
    const int words_count = CountStringList(words);
    T* parsed = nullptr;
    if (words_count > 0) {
        parsed = static_cast<T*>(HMalloc(sizeof(T) * static_cast<size_t>(words_count)));
        for (int i = 0; i < words_count; ++i) {
            parsed[i] = convert(words[i]);
        }
    }
    DestroyStringList(words);
    free(values);
    values = parsed;
    count = words_count;
}

// Joins the element texts with one blank; `put` writes one element's text
// of at most kNumberTextMax bytes and returns its end.
template <class T, class Put>
char* JoinElements(int count, const T* values, Put put) {
    std::string text;
    char element[kNumberTextMax + 1];
    for (int i = 0; i < count; ++i) {
        if (i > 0) {
            text += ' ';
        }
        text.append(element, put(element, values[i]));
    }
    return HString(text.c_str());
}

int ReadInteger(const char* word) {
    return TZN_atoi(word);
}

// atof truncated toward zero; values beyond the range of int are clamped
// (converting them directly would be undefined) and NaN gives 0.
int ReadTruncatedInteger(const char* word) {
    const double value = TZN_atof(word);
    if (isnan(value)) {
        return 0;
    }
    if (value >= static_cast<double>(INT_MAX)) {
        return INT_MAX;
    }
    if (value <= static_cast<double>(INT_MIN)) {
        return INT_MIN;
    }
    return static_cast<int>(value);
}

double ReadDouble(const char* word) {
    return TZN_atof(word);
}

char* PutWidenedInteger(char* out, int value) {
    return PutFixed(out, static_cast<double>(value));
}

}  // namespace

// ---------------------------------------------------------------------------
// PTNStringList

PTNStringList::PTNStringList(const char* name, char* const* value)
    : DWXParseTreeNode(name), ppcValue(DuplicateStringList(value)) {}

PTNStringList::PTNStringList(const PTNStringList& other)
    : DWXParseTreeNode(other), ppcValue(DuplicateStringList(other.ppcValue)) {}

PTNStringList& PTNStringList::operator=(const PTNStringList& other) {
    if (this != &other) {
        DWXParseTreeNode::operator=(other);
        SetValue(other.ppcValue);
    }
    return *this;
}

PTNStringList::~PTNStringList() {
    DestroyStringList(ppcValue);
}

void PTNStringList::SetValue(char* const* value) {
    char** copy = DuplicateStringList(value);  // first: `value` may be our own list
    DestroyStringList(ppcValue);
    ppcValue = copy;
}

void PTNStringList::SetAsStringList(char* const* tokens) {
    const int count = CountStringList(tokens);
    char** entries = static_cast<char**>(HCalloc(sizeof(char*), static_cast<size_t>(count) + 1));
    for (int i = 0; i < count; ++i) {
        entries[i] = HString(UnquoteToken(tokens[i]).c_str());
    }
    DestroyStringList(ppcValue);
    ppcValue = entries;
}

const char* PTNStringList::GetClassName() const {
    return "PTNStringList";
}

DWXParseTreeNode* PTNStringList::Copy() {
    return KeepSource(new PTNStringList(GetName(), ppcValue));
}

char* PTNStringList::GetAsString() const {
    std::string text;
    for (char* const* entry = ppcValue; entry != nullptr && *entry != nullptr; ++entry) {
        char* token = QuoteToken(*entry);
        if (entry != ppcValue) {
            text += ' ';
        }
        text += token;
        free(token);
    }
    return HString(text.c_str());
}

void PTNStringList::SetFrom(DWXParseTreeNode* other) {
    if (auto* source = dynamic_cast<PTNStringList*>(other)) {
        SetValue(source->ppcValue);
    }
}

// ---------------------------------------------------------------------------
// PTNIntegerList

PTNIntegerList::PTNIntegerList(const char* name, int count, const int* values)
    : DWXParseTreeNode(name), nCount(0), pnValues(nullptr) {
    ReplaceElements(nCount, pnValues, count, values);
}

PTNIntegerList::PTNIntegerList(const PTNIntegerList& other)
    : PTNIntegerList(other.GetName(), other.nCount, other.pnValues) {
    other.KeepSource(this);
}

PTNIntegerList& PTNIntegerList::operator=(const PTNIntegerList& other) {
    if (this != &other) {
        DWXParseTreeNode::operator=(other);
        ReplaceElements(nCount, pnValues, other.nCount, other.pnValues);
    }
    return *this;
}

PTNIntegerList::~PTNIntegerList() {
    free(pnValues);
}

int* PTNIntegerList::GetValue(int* count) const {
    if (count != nullptr) {
        *count = nCount;
    }
    return pnValues;
}

void PTNIntegerList::SetValue(int count, const int* values) {
    ReplaceElements(nCount, pnValues, count, values);
}

void PTNIntegerList::SetAsString(const char* text) {
    ParseElements(text, nCount, pnValues, ReadInteger);
}

const char* PTNIntegerList::GetClassName() const {
    return "PTNIntegerList";
}

DWXParseTreeNode* PTNIntegerList::Copy() {
    return KeepSource(new PTNIntegerList(GetName(), nCount, pnValues));
}

char* PTNIntegerList::GetAsString() const {
    return JoinElements(nCount, pnValues, PutInteger);
}

void PTNIntegerList::SetFrom(DWXParseTreeNode* other) {
    auto* source = dynamic_cast<PTNIntegerList*>(other);
    if (source != nullptr && source->nCount > 0 && source->pnValues != nullptr) {
        ReplaceElements(nCount, pnValues, source->nCount, source->pnValues);
    }
}

// ---------------------------------------------------------------------------
// PTNInteger32List

PTNInteger32List::PTNInteger32List(const char* name, int count, const int* values)
    : DWXParseTreeNode(name), nCount(0), pnValues(nullptr) {
    ReplaceElements(nCount, pnValues, count, values);
}

PTNInteger32List::PTNInteger32List(const PTNInteger32List& other)
    : PTNInteger32List(other.GetName(), other.nCount, other.pnValues) {
    other.KeepSource(this);
}

PTNInteger32List& PTNInteger32List::operator=(const PTNInteger32List& other) {
    if (this != &other) {
        DWXParseTreeNode::operator=(other);
        ReplaceElements(nCount, pnValues, other.nCount, other.pnValues);
    }
    return *this;
}

PTNInteger32List::~PTNInteger32List() {
    free(pnValues);
}

int* PTNInteger32List::GetValue(int* count) const {
    if (count != nullptr) {
        *count = nCount;
    }
    return pnValues;
}

void PTNInteger32List::SetValue(int count, const int* values) {
    ReplaceElements(nCount, pnValues, count, values);
}

void PTNInteger32List::SetAsString(const char* text) {
    ParseElements(text, nCount, pnValues, ReadTruncatedInteger);
}

const char* PTNInteger32List::GetClassName() const {
    return "PTNInteger32List";
}

DWXParseTreeNode* PTNInteger32List::Copy() {
    return KeepSource(new PTNInteger32List(GetName(), nCount, pnValues));
}

char* PTNInteger32List::GetAsString() const {
    return JoinElements(nCount, pnValues, PutWidenedInteger);
}

void PTNInteger32List::SetFrom(DWXParseTreeNode* other) {
    auto* source = dynamic_cast<PTNInteger32List*>(other);
    if (source != nullptr && source->nCount > 0 && source->pnValues != nullptr) {
        ReplaceElements(nCount, pnValues, source->nCount, source->pnValues);
    }
}

// ---------------------------------------------------------------------------
// PTNDoubleList

PTNDoubleList::PTNDoubleList(const char* name, int count, const double* values)
    : DWXParseTreeNode(name), nCount(0), pdValues(nullptr) {
    ReplaceElements(nCount, pdValues, count, values);
}

PTNDoubleList::PTNDoubleList(const PTNDoubleList& other)
    : PTNDoubleList(other.GetName(), other.nCount, other.pdValues) {
    other.KeepSource(this);
}

PTNDoubleList& PTNDoubleList::operator=(const PTNDoubleList& other) {
    if (this != &other) {
        DWXParseTreeNode::operator=(other);
        ReplaceElements(nCount, pdValues, other.nCount, other.pdValues);
    }
    return *this;
}

PTNDoubleList::~PTNDoubleList() {
    free(pdValues);
}

double* PTNDoubleList::GetValue(int* count) const {
    if (count != nullptr) {
        *count = nCount;
    }
    return pdValues;
}

void PTNDoubleList::SetValue(int count, const double* values) {
    ReplaceElements(nCount, pdValues, count, values);
}

void PTNDoubleList::SetAsString(const char* text) {
    ParseElements(text, nCount, pdValues, ReadDouble);
}

const char* PTNDoubleList::GetClassName() const {
    return "PTNDoubleList";
}

DWXParseTreeNode* PTNDoubleList::Copy() {
    return KeepSource(new PTNDoubleList(GetName(), nCount, pdValues));
}

char* PTNDoubleList::GetAsString() const {
    return JoinElements(nCount, pdValues, PutShortest);
}

void PTNDoubleList::SetFrom(DWXParseTreeNode* other) {
    auto* source = dynamic_cast<PTNDoubleList*>(other);
    if (source != nullptr && source->nCount > 0 && source->pdValues != nullptr) {
        ReplaceElements(nCount, pdValues, source->nCount, source->pdValues);
    }
}

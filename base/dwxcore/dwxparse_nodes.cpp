// The node base class and the six scalar leaves.
#include <dwxcore/dwxparse.h>

#include <services/rtprim.h>

#include <stdlib.h>
#include <string.h>

#include <string>

#include "internal/dwxparse_numbers.h"
#include "internal/dwxparse_pool.h"
#include "internal/dwxparse_token.h"

namespace {

using namespace dwxcore::internal;

// Numeric setters take a null text as an empty one.
const char* TextOrEmpty(const char* text) {
    return text != nullptr ? text : "";
}

// A copy of a long name from the node pool, next to the node when the node
// was just made, so that reading a node's name seldom needs another cache line.
char* PooledName(const char* name, size_t size) {
    void* copy = dwxcore::internal::Allocate(size);
    if (copy == nullptr) {
        throw std::bad_alloc();
    }
    return static_cast<char*>(memcpy(copy, name, size));
}

// A heap copy of the text that a Put function wrote into `buffer`.
char* CopyToHeap(char* buffer, char* end) {
    *end = '\0';
    return HString(buffer);
}

}  // namespace

// ---------------------------------------------------------------------------
// DWXParseTreeNode

DWXParseTreeNode::DWXParseTreeNode(const char* name)
    : pcName(nullptr), poParent(nullptr), poSource(nullptr), nSourceLine(0) {
    InitName(name);
}

DWXParseTreeNode::DWXParseTreeNode(const DWXParseTreeNode& other)
    : DWXObject(other),
      pcName(nullptr),
      poParent(nullptr),
      poSource(other.poSource),
      nSourceLine(other.nSourceLine) {
    InitName(other.pcName);
}

DWXParseTreeNode& DWXParseTreeNode::operator=(const DWXParseTreeNode& other) {
    if (this != &other) {
        SetName(other.pcName);
    }
    return *this;
}

DWXParseTreeNode::~DWXParseTreeNode() {
    if (poParent != nullptr) {
        poParent->ForgetChild(this);
    }
    FreeName();
}

void* DWXParseTreeNode::operator new(size_t size) {
    void* block = dwxcore::internal::Allocate(size);
    if (block == nullptr) {
        throw std::bad_alloc();
    }
    return block;
}

void* DWXParseTreeNode::operator new(size_t size, const std::nothrow_t&) noexcept {
    return dwxcore::internal::Allocate(size);
}

void DWXParseTreeNode::operator delete(void* block, size_t size) noexcept {
    dwxcore::internal::Release(block, size);
}

void DWXParseTreeNode::operator delete(void* block, const std::nothrow_t&) noexcept {
    dwxcore::internal::Release(block, 0);
}

void DWXParseTreeNode::InitName(const char* name) {
    if (name == nullptr) {
        pcName = nullptr;
        return;
    }
    size_t size = strlen(name) + 1;
    if (size <= kShortName) {
        memcpy(acShortName, name, size);
        pcName = acShortName;
    } else {
        pcName = PooledName(name, size);
    }
}

void DWXParseTreeNode::FreeName() {
    if (pcName != nullptr && pcName != acShortName) {
        dwxcore::internal::Release(pcName, strlen(pcName) + 1);
    }
}

void DWXParseTreeNode::SetName(const char* name) {
    if (poParent != nullptr) {
        poParent->RenameChild(this, name);
    } else {
        ReplaceName(name);
    }
}

void DWXParseTreeNode::ReplaceName(const char* name) {
    // Copied first: `name` may be our own name or lie inside it.
    if (name != nullptr && strlen(name) < kShortName) {
        char copy[kShortName];
        memcpy(copy, name, strlen(name) + 1);
        FreeName();
        InitName(copy);
        return;
    }
    char* copy = name != nullptr ? PooledName(name, strlen(name) + 1) : nullptr;
    FreeName();
    pcName = copy;
}

// ---------------------------------------------------------------------------
// PTNBool

PTNBool::PTNBool(const char* name, int value) : DWXParseTreeNode(name), nValue(value) {}
PTNBool::~PTNBool() {}

void PTNBool::SetAsString(const char* text) {
    nValue = (text != nullptr && _stricmp(text, "TRUE") == 0) ? 1 : 0;
}

const char* PTNBool::GetClassName() const {
    return "PTNBool";
}

DWXParseTreeNode* PTNBool::Copy() {
    return KeepSource(new PTNBool(GetName(), nValue));
}

char* PTNBool::GetAsString() const {
    return HString(BoolText(nValue));
}

void PTNBool::SetFrom(DWXParseTreeNode* other) {
    if (auto* source = dynamic_cast<PTNBool*>(other)) {
        nValue = source->nValue;
    }
}

// ---------------------------------------------------------------------------
// PTNChar

PTNChar::PTNChar(const char* name, char value) : DWXParseTreeNode(name), cValue(value) {}
PTNChar::~PTNChar() {}

void PTNChar::SetAsString(const char* text) {
    cValue = TextOrEmpty(text)[0];
}

const char* PTNChar::GetClassName() const {
    return "PTNChar";
}

DWXParseTreeNode* PTNChar::Copy() {
    return KeepSource(new PTNChar(GetName(), cValue));
}

char* PTNChar::GetAsString() const {
    // "%c" of 0 writes the terminator itself, so 0 renders as the empty text.
    char text[2];
    return CopyToHeap(text, PutCharacter(text, cValue));
}

void PTNChar::SetFrom(DWXParseTreeNode* other) {
    if (auto* source = dynamic_cast<PTNChar*>(other)) {
        cValue = source->cValue;
    }
}

// ---------------------------------------------------------------------------
// PTNInteger

PTNInteger::PTNInteger(const char* name, int value) : DWXParseTreeNode(name), nValue(value) {}
PTNInteger::~PTNInteger() {}

void PTNInteger::SetAsString(const char* text) {
    nValue = TZN_atoi(TextOrEmpty(text));
}

const char* PTNInteger::GetClassName() const {
    return "PTNInteger";
}

DWXParseTreeNode* PTNInteger::Copy() {
    return KeepSource(new PTNInteger(GetName(), nValue));
}

char* PTNInteger::GetAsString() const {
    char text[kNumberTextMax + 1];
    return CopyToHeap(text, PutInteger(text, nValue));
}

void PTNInteger::SetFrom(DWXParseTreeNode* other) {
    if (auto* source = dynamic_cast<PTNInteger*>(other)) {
        nValue = source->nValue;
    }
}

// ---------------------------------------------------------------------------
// PTNFloat

PTNFloat::PTNFloat(const char* name, float value) : DWXParseTreeNode(name), fValue(value) {}
PTNFloat::~PTNFloat() {}

void PTNFloat::SetAsString(const char* text) {
    fValue = static_cast<float>(TZN_atof(TextOrEmpty(text)));
}

const char* PTNFloat::GetClassName() const {
    return "PTNFloat";
}

DWXParseTreeNode* PTNFloat::Copy() {
    return KeepSource(new PTNFloat(GetName(), fValue));
}

char* PTNFloat::GetAsString() const {
    char text[kNumberTextMax + 1];
    return CopyToHeap(text, PutFixed(text, static_cast<double>(fValue)));
}

void PTNFloat::SetFrom(DWXParseTreeNode* other) {
    if (auto* source = dynamic_cast<PTNFloat*>(other)) {
        fValue = source->fValue;
    }
}

// ---------------------------------------------------------------------------
// PTNDouble

PTNDouble::PTNDouble(const char* name, double value) : DWXParseTreeNode(name), dValue(value) {}
PTNDouble::~PTNDouble() {}

void PTNDouble::SetAsString(const char* text) {
    dValue = TZN_atof(TextOrEmpty(text));
}

const char* PTNDouble::GetClassName() const {
    return "PTNDouble";
}

DWXParseTreeNode* PTNDouble::Copy() {
    return KeepSource(new PTNDouble(GetName(), dValue));
}

char* PTNDouble::GetAsString() const {
    char text[kNumberTextMax + 1];
    return CopyToHeap(text, PutShortest(text, dValue));
}

void PTNDouble::SetFrom(DWXParseTreeNode* other) {
    if (auto* source = dynamic_cast<PTNDouble*>(other)) {
        dValue = source->dValue;
    }
}

// ---------------------------------------------------------------------------
// PTNString

PTNString::PTNString(const char* name, const char* value)
    : DWXParseTreeNode(name), pcValue(nullptr) {
    SetValue(value);
}

PTNString::PTNString(const PTNString& other) : DWXParseTreeNode(other), pcValue(nullptr) {
    SetValue(other.pcValue);
}

PTNString& PTNString::operator=(const PTNString& other) {
    if (this != &other) {
        DWXParseTreeNode::operator=(other);
        SetValue(other.pcValue);
    }
    return *this;
}

PTNString::~PTNString() {
    FreeValue();
}

void PTNString::FreeValue() {
    if (pcValue != acShortValue) {
        free(pcValue);
    }
    pcValue = nullptr;
}

void PTNString::SetValue(const char* value) {
    // Copied first: `value` may be our own value or lie inside it.
    if (value != nullptr) {
        size_t size = strlen(value) + 1;
        if (size <= kShortValue) {
            char copy[kShortValue];
            memcpy(copy, value, size);
            FreeValue();
            memcpy(acShortValue, copy, size);
            pcValue = acShortValue;
            return;
        }
    }
    char* copy = HString(value);
    FreeValue();
    pcValue = copy;
}

void PTNString::SetAsString(const char* text) {
    SetValue(UnquoteToken(text).c_str());
}

const char* PTNString::GetClassName() const {
    return "PTNString";
}

DWXParseTreeNode* PTNString::Copy() {
    return KeepSource(new PTNString(GetName(), pcValue));
}

char* PTNString::GetAsString() const {
    return QuoteToken(pcValue);
}

void PTNString::SetFrom(DWXParseTreeNode* other) {
    if (auto* source = dynamic_cast<PTNString*>(other)) {
        SetValue(source->pcValue);
    }
}

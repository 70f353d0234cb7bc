#include <dwxcore/dwxcmdline.h>

#include <dwxcore/dwxstring.h>
#include <services/utilhub.h>

#include <stdlib.h>

#include <memory>

namespace {

struct StringListDeleter {
    void operator()(char** list) const { DestroyStringList(list); }
};
using StringList = std::unique_ptr<char*, StringListDeleter>;

}  // namespace

// ---------------------------------------------------------------------------
// DWXCmdLineOption

DWXCmdLineOption::DWXCmdLineOption(const char* name)
    : pszName(HString(name ? name : "")), ppszValues(nullptr), nCount(0) {}

DWXCmdLineOption::DWXCmdLineOption(const DWXCmdLineOption& other)
    : DWXObject(other),
      pszName(HString(other.pszName)),
      ppszValues(DuplicateStringList(other.ppszValues)),
      nCount(other.nCount) {}

DWXCmdLineOption& DWXCmdLineOption::operator=(const DWXCmdLineOption& other) {
    if (&other != this) {
        char* name = HString(other.pszName);
        char** values = DuplicateStringList(other.ppszValues);
        free(pszName);
        DestroyStringList(ppszValues);
        pszName = name;
        ppszValues = values;
        nCount = other.nCount;
    }
    return *this;
}

DWXCmdLineOption::~DWXCmdLineOption() {
    free(pszName);
    DestroyStringList(ppszValues);
}

void DWXCmdLineOption::Close(const char* valueText) {
    DestroyStringList(ppszValues);
    ppszValues = TokenizeDelim(valueText, "|");
    nCount = CountStringList(ppszValues);
}

// ---------------------------------------------------------------------------
// DWXCmdLine

DWXCmdLine::DWXCmdLine(int count, const char* const* vector) {
    Generate(count, vector);
}

DWXCmdLine::DWXCmdLine(const char* command) {
    StringList pieces(TokenizeDelim(command ? command : "", " "));
    Generate(CountStringList(pieces.get()), pieces.get());
}

DWXCmdLine::DWXCmdLine(const DWXCmdLine& other) : DWXObject(other) {
    CopyOptions(other);
}

DWXCmdLine& DWXCmdLine::operator=(const DWXCmdLine& other) {
    if (&other != this) {
        oOptions.DestroyContents();
        CopyOptions(other);
    }
    return *this;
}

DWXCmdLine::~DWXCmdLine() {
    oOptions.DestroyContents();
}

void DWXCmdLine::CopyOptions(const DWXCmdLine& other) {
    for (int i = 0; i < other.oOptions.GetCount(); ++i) {
        const auto* option = static_cast<const DWXCmdLineOption*>(other.oOptions[i]);
        oOptions.Add(new DWXCmdLineOption(*option));
    }
}

void DWXCmdLine::Generate(int count, const char* const* vector) {
    if (count <= 0 || !vector) {
        return;
    }
    auto* current = new DWXCmdLineOption(vector[0]);
    oOptions.Add(current);

    // The values of the current option, each followed by "|".
    DWXString values;
    for (int i = 1; i < count; ++i) {
        const char* argument = vector[i] ? vector[i] : "";
        if (argument[0] == '-' && argument[1] != '-') {
            // Every option but the last is closed, with or without values.
            current->Close(values);
            current = new DWXCmdLineOption(argument);
            oOptions.Add(current);
            values.SetLength(0);
        } else {
            if (argument[0] == '-') {
                ++argument;  // "--x" is the value "-x"
            }
            values += argument;
            values += '|';
        }
    }
    if (!values.IsEmpty()) {
        current->Close(values);
    }
}

DWXCmdLineOption* DWXCmdLine::FindOption(const char* name) const {
    if (!name) {
        return nullptr;
    }
    for (int i = 0; i < oOptions.GetCount(); ++i) {
        auto* option = static_cast<DWXCmdLineOption*>(oOptions[i]);
        if (_stricmp(option->pszName, name) == 0) {
            return option;
        }
    }
    return nullptr;
}

const char* DWXCmdLine::ValueAt(const char* name, int index) const {
    const DWXCmdLineOption* option = FindOption(name);
    if (!option || index < 0 || index >= option->nCount) {
        return nullptr;
    }
    return option->ppszValues[index];
}

int DWXCmdLine::Exist(const char* name) const {
    return FindOption(name) != nullptr;
}

int DWXCmdLine::Count(const char* name) const {
    const DWXCmdLineOption* option = FindOption(name);
    return option ? option->nCount : 0;
}

int DWXCmdLine::GetInt(const char* name, int defaultValue, int index) const {
    const char* value = ValueAt(name, index);
    return value ? TZN_atoi(value) : defaultValue;
}

float DWXCmdLine::GetFloat(const char* name, float defaultValue, int index) const {
    const char* value = ValueAt(name, index);
    return value ? static_cast<float>(TZN_atof(value)) : defaultValue;
}

const char* DWXCmdLine::GetString(const char* name, const char* defaultValue, int index) const {
    const char* value = ValueAt(name, index);
    return value ? value : defaultValue;
}

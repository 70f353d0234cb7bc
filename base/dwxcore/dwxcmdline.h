// Command-line parsing: argument vectors and command strings turned into
// options, each with the values that follow it.
//
// Syntax: an argument whose first character is a hyphen and whose second is
// not opens a new option (a lone "-" and negative numbers such as "-5"
// included); every other argument is a value of the option opened last. A
// value that begins with a hyphen is written with two ("--5" is the value
// "-5"). A "|" inside an argument splits it into several values. Empty
// arguments give no value.
#pragma once

#include <dwxcore/dwxcore_export.h>
#include <dwxcore/dwxobject.h>

// One option: its name as written (hyphen included) and its values in
// command-line order. Owns its name and value list; copies are deep.
class DWXCORE_API DWXCmdLineOption : public DWXObject {
  public:
    DWXCmdLineOption(const char* name);
    DWXCmdLineOption(const DWXCmdLineOption& other);
    DWXCmdLineOption& operator=(const DWXCmdLineOption& other);
    ~DWXCmdLineOption() override;

    const char* GetClassName() const override { return "Option"; }

  private:
    friend class DWXCmdLine;

    // Splits the collected value text at "|" into the value list.
    void Close(const char* valueText);

    char* pszName;      // heap copy; never null
    char** ppszValues;  // string list, or null until the option is closed
    int nCount;         // entries in ppszValues
};

// The options of one command line. Entry 0 stands for the program name and
// collects the arguments that come before the first option. Owns its options;
// copies are deep. Queries name options as written ("-o", not "o"), ignoring
// ASCII case, and find the first of repeated options; a null name finds nothing.
class DWXCORE_API DWXCmdLine : public DWXObject {
  public:
    // Parses `count` arguments, the first being the program name. The strings
    // are copied. A count of 0 or less gives a parser without entries.
    DWXCmdLine(int count, const char* const* vector);
    // Parses one command string split at blanks (no quoting); its first word
    // plays the program name.
    DWXCmdLine(const char* command);
    DWXCmdLine(const DWXCmdLine& other);
    DWXCmdLine& operator=(const DWXCmdLine& other);
    ~DWXCmdLine() override;

    // 1 when an option of that name exists, else 0.
    int Exist(const char* name) const;
    // The number of values of the option; 0 when it is absent.
    int Count(const char* name) const;
    // The value at `index` read with atoi / atof; `defaultValue` when the
    // option is absent or `index` is outside its values.
    int GetInt(const char* name, int defaultValue, int index = 0) const;
    float GetFloat(const char* name, float defaultValue, int index = 0) const;
    // The value text at `index`, borrowed and valid until the parser is
    // destroyed; otherwise `defaultValue` itself.
    const char* GetString(const char* name, const char* defaultValue, int index = 0) const;

    const char* GetClassName() const override { return "DWXCmdLine"; }

  private:
    DWXCmdLineOption* FindOption(const char* name) const;
    // The value text of the option at `index`, or null.
    const char* ValueAt(const char* name, int index) const;
    void Generate(int count, const char* const* vector);
    void CopyOptions(const DWXCmdLine& other);

    DWXArray oOptions;  // DWXCmdLineOption objects in command-line order
};

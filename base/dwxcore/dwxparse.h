// The parse tree: named, typed values in a tree of subtrees and leaves, with
// the line-oriented text form that every leaf renders and reads, and the
// Base64 codec that carries byte data through it.
//
// Ownership throughout: every name, text, list and array passed in is copied;
// getters lend the node's own storage; texts and nodes handed out as new are
// the caller's (texts are released with free(), nodes with delete). A subtree
// owns its children and deletes them with itself.
//
// Numbers: "atoi"/"atof" below mean their rules as the "C" locale applies them,
// whatever locale the host has set; numbers are written with a point always.
#pragma once

#include <dwxcore/dwxcore_export.h>
#include <dwxcore/dwxobject.h>

#include <stddef.h>
#include <stdio.h>

#include <new>
#include <string>
#include <vector>

class PTNSubTree;
class DWXParseTreeNode;

// Where a node was read from: a file as the reader opened it ("Memory" for a
// buffer) and, for an included file, the file and line of the directive that
// included it (`includedBy` null for the file the read started from). Records
// are shared by every node read from the same place and live as long as the
// process; the same file reached by the same chain always gives the same
// record, so reading the same files again allocates none.
struct PTNSourceFile {
    const char* name;
    const PTNSourceFile* includedBy;
    int includedAtLine;
};

// One report of a read: what the reader would give IMPError, or a warning
// about a line that was dropped or read differently from how it looks.
// `file` and `line` name the place it arose: the included file and its own
// line for a line inside an include, "Memory" for a buffer; lines count from 1.
struct PTNReadReport {
    int code;
    int severity;
    std::string file;
    int line;
    std::string message;
};

// What one or more reads given this log met. Reports and files accumulate
// over the reads it is given. Warnings go only here, never to IMPError.
class PTNReadLog {
  public:
    // Codes of the warnings (severity 3).
    enum WarningCode {
        kUnknownKeyword = 101,  // a type keyword the reader builds nothing for
        kTopLevelClose,         // a closing line outside every subtree: the rest is not read
        kBlankAfterParen,       // "( name": the name is empty, the next word is the keyword
        kIntegerText,           // an Integer value that is not a number or does not fit in int
        kDoubleText,            // a Double value that is not a number
        kJoinedString           // a String whose value tokens were joined
    };

    // True when there are no reports; warnings do not count.
    bool Ok() const { return oReports.empty(); }
    const std::vector<PTNReadReport>& Reports() const { return oReports; }
    const std::vector<PTNReadReport>& Warnings() const { return oWarnings; }
    // Every file opened, once each, in the order first opened; the file a
    // read started from comes before the files it includes.
    const std::vector<std::string>& Files() const { return oFiles; }

  private:
    friend struct PTNReadLogWriter;  // the reader's access

    std::vector<PTNReadReport> oReports;
    std::vector<PTNReadReport> oWarnings;
    std::vector<std::string> oFiles;
    std::vector<std::string> oCanonicalFiles;  // the same files by canonical path
};

// The node classes of the library, one for each type keyword of the text
// format: SubTree for PTNSubTree, String for PTNString and so on.
enum class PTNKind {
    kSubTree,
    kString,
    kStringList,
    kInteger,
    kChar,
    kBool,
    kFloat,
    kDouble,
    kDoubleList,
    kIntegerList,
    kInteger32List,
    kBase64,
    kOther  // null, or any other class, a host's subclass of a library class included
};

// The kind of the exact class of `node`, as the writer dispatches on it.
// O(number of kinds).
DWXCORE_API PTNKind PTNKindOf(const DWXParseTreeNode* node);

// The type keyword the writer writes for a class name: the name without its
// first three characters (its "PTN"), the whole of a shorter name, "" for null.
DWXCORE_API const char* PTNTypeKeyword(const char* className);

// Base of every node: a name owned by the node and a borrowed pointer to the
// subtree that holds it (null until the node is added to one).
//
// Nodes created with new come from the library's node pool: blocks carved
// from slabs of about 64 KB, each slab handed back to the C heap as soon as
// the last node in it is deleted, whichever thread deletes it. Reading and
// deleting a large tree thus costs a few hundred slabs instead of a heap
// block per node. Deleting a single node with delete always works.
class DWXCORE_API DWXParseTreeNode : public DWXObject {
  public:
    explicit DWXParseTreeNode(const char* name);
    // A node that still has a parent takes itself out of that parent's
    // children first, so deleting a child by hand leaves no dangling pointer.
    ~DWXParseTreeNode() override;

    static void* operator new(size_t size);
    static void* operator new(size_t size, const std::nothrow_t&) noexcept;
    static void* operator new(size_t, void* where) noexcept { return where; }
    static void operator delete(void* block, size_t size) noexcept;
    static void operator delete(void* block, const std::nothrow_t&) noexcept;
    static void operator delete(void*, void*) noexcept {}

    // Borrowed; valid until SetName or destruction.
    const char* GetName() const { return pcName; }
    // The parent, if any, keeps its name lookups right.
    void SetName(const char* name);
    // Only records the pointer; it does not add the node to that subtree.
    // The parent recorded must hold the node or be null: the destructor and
    // SetName tell it.
    void SetParent(PTNSubTree* parent) { poParent = parent; }
    PTNSubTree* GetParentRef() const { return poParent; }

    // The line the reader built this node from; 0 for a node it did not build.
    int GetSourceLine() const { return nSourceLine; }
    // The file of that line; null for a node the reader did not build.
    // Borrowed; valid as long as the process.
    const PTNSourceFile* GetSourceFile() const { return poSource; }

    const char* GetClassName() const override = 0;
    // A new node of the same class with its own copies of name and value and
    // a null parent. Caller owns it.
    virtual DWXParseTreeNode* Copy() = 0;
    // The value as text of the file format. Caller frees with free().
    virtual char* GetAsString() const = 0;
    // Takes other's value when other is an instance of this node's class;
    // otherwise (null included) nothing changes. Name and parent never change.
    virtual void SetFrom(DWXParseTreeNode* other) = 0;

  protected:
    // Copies the name and the source; the copy has a null parent.
    DWXParseTreeNode(const DWXParseTreeNode& other);
    // Copies the name; the parent and the source stay, as the node stays
    // where it is.
    DWXParseTreeNode& operator=(const DWXParseTreeNode& other);
    // Gives `copy`, a copy of this node, this node's source; returns `copy`.
    DWXParseTreeNode* KeepSource(DWXParseTreeNode* copy) const {
        copy->poSource = poSource;
        copy->nSourceLine = nSourceLine;
        return copy;
    }

  private:
    friend struct PTNSourceSetter;  // the reader records where it built a node

    // A name this short (its terminator included) is kept in the node
    // itself, which saves most nodes a block of their own; a longer one comes
    // from the node pool. pcName points at whichever storage holds the name
    // (null for a null name).
    static constexpr size_t kShortName = 8;
    void InitName(const char* name);
    void FreeName();
    // SetName without telling the parent.
    void ReplaceName(const char* name);

    friend class PTNSubTree;

    char* pcName;
    PTNSubTree* poParent;
    char acShortName[kShortName];
    const PTNSourceFile* poSource;
    int nSourceLine;
};

// ---------------------------------------------------------------------------
// Scalar leaves. Copies and assignments copy deeply, like Copy().

// Any value other than 0 is true and is kept as given.
class DWXCORE_API PTNBool : public DWXParseTreeNode {
  public:
    PTNBool(const char* name, int value);
    PTNBool(const PTNBool& other) = default;
    PTNBool& operator=(const PTNBool& other) = default;
    ~PTNBool() override;

    int GetValue() const { return nValue; }
    void SetValue(int value) { nValue = value; }
    // 1 for "TRUE" in any case, 0 for every other text and for null.
    void SetAsString(const char* text);

    const char* GetClassName() const override;
    DWXParseTreeNode* Copy() override;
    // "TRUE" or "FALSE".
    char* GetAsString() const override;
    void SetFrom(DWXParseTreeNode* other) override;

  private:
    int nValue;
};

class DWXCORE_API PTNChar : public DWXParseTreeNode {
  public:
    PTNChar(const char* name, char value);
    PTNChar(const PTNChar& other) = default;
    PTNChar& operator=(const PTNChar& other) = default;
    ~PTNChar() override;

    char GetValue() const { return cValue; }
    void SetValue(char value) { cValue = value; }
    // The first byte of the text; 0 for an empty or null text.
    void SetAsString(const char* text);

    const char* GetClassName() const override;
    DWXParseTreeNode* Copy() override;
    // The character itself; the empty text for 0.
    char* GetAsString() const override;
    void SetFrom(DWXParseTreeNode* other) override;

  private:
    char cValue;
};

class DWXCORE_API PTNInteger : public DWXParseTreeNode {
  public:
    PTNInteger(const char* name, int value);
    PTNInteger(const PTNInteger& other) = default;
    PTNInteger& operator=(const PTNInteger& other) = default;
    ~PTNInteger() override;

    int GetValue() const { return nValue; }
    void SetValue(int value) { nValue = value; }
    // atoi of the text; null is taken as an empty text (0).
    void SetAsString(const char* text);

    const char* GetClassName() const override;
    DWXParseTreeNode* Copy() override;
    // "%d".
    char* GetAsString() const override;
    void SetFrom(DWXParseTreeNode* other) override;

  private:
    int nValue;
};

class DWXCORE_API PTNFloat : public DWXParseTreeNode {
  public:
    PTNFloat(const char* name, float value);
    PTNFloat(const PTNFloat& other) = default;
    PTNFloat& operator=(const PTNFloat& other) = default;
    ~PTNFloat() override;

    float GetValue() const { return fValue; }
    void SetValue(float value) { fValue = value; }
    // atof of the text, narrowed; null is taken as an empty text (0).
    void SetAsString(const char* text);

    const char* GetClassName() const override;
    DWXParseTreeNode* Copy() override;
    // "%f" of the value widened to double: six decimals.
    char* GetAsString() const override;
    void SetFrom(DWXParseTreeNode* other) override;

  private:
    float fValue;
};

class DWXCORE_API PTNDouble : public DWXParseTreeNode {
  public:
    PTNDouble(const char* name, double value);
    PTNDouble(const PTNDouble& other) = default;
    PTNDouble& operator=(const PTNDouble& other) = default;
    ~PTNDouble() override;

    double GetValue() const { return dValue; }
    void SetValue(double value) { dValue = value; }
    // atof of the text; null is taken as an empty text (0).
    void SetAsString(const char* text);

    const char* GetClassName() const override;
    DWXParseTreeNode* Copy() override;
    // The shortest decimal text that atof reads back to the same value.
    char* GetAsString() const override;
    void SetFrom(DWXParseTreeNode* other) override;

  private:
    double dValue;
};

// The value is a heap copy owned by the node and may be null.
class DWXCORE_API PTNString : public DWXParseTreeNode {
  public:
    PTNString(const char* name, const char* value);
    PTNString(const PTNString& other);
    PTNString& operator=(const PTNString& other);
    ~PTNString() override;

    // Borrowed, may be null; valid until the value is replaced.
    const char* GetValue() const { return pcValue; }
    void SetValue(const char* value);
    // Reads a quoted token: escapes undone, translation forms and the
    // MkTokenString list form expanded. Null gives an empty value.
    void SetAsString(const char* text);

    const char* GetClassName() const override;
    DWXParseTreeNode* Copy() override;
    // The value as a quoted token; a null value gives \q\q.
    char* GetAsString() const override;
    void SetFrom(DWXParseTreeNode* other) override;

  private:
    // The reader's way to hand over a value it has already allocated.
    friend struct PTNStringAdopter;

    // A value this short (its terminator included) is kept in the node
    // itself, as short names are; pcValue points at whichever storage holds
    // the value (null for a null value).
    static constexpr size_t kShortValue = 16;
    void FreeValue();

    char* pcValue;
    char acShortValue[kShortValue];
};

// ---------------------------------------------------------------------------
// List leaves. Copies and assignments copy deeply, like Copy().

// The value is a string list owned by the node; it may be null.
class DWXCORE_API PTNStringList : public DWXParseTreeNode {
  public:
    // Copies the list; a null list keeps a null value.
    PTNStringList(const char* name, char* const* value);
    PTNStringList(const PTNStringList& other);
    PTNStringList& operator=(const PTNStringList& other);
    ~PTNStringList() override;

    // Borrowed, may be null; valid until the value is replaced.
    char** GetValue() const { return ppcValue; }
    // Copies the list; a null list gives a null value.
    void SetValue(char* const* value);
    // Each token is read as PTNString::SetAsString reads its text. The tokens
    // are not changed; a null or empty token list gives a list without entries.
    void SetAsStringList(char* const* tokens);

    const char* GetClassName() const override;
    DWXParseTreeNode* Copy() override;
    // Every entry as a quoted token, separated by one blank; the empty text
    // for a null list or one without entries.
    char* GetAsString() const override;
    // Takes a copy of other's list whatever it holds, empty or null included.
    void SetFrom(DWXParseTreeNode* other) override;

  private:
    char** ppcValue;
};

// An array of int written as "%d" words and read with atoi.
class DWXCORE_API PTNIntegerList : public DWXParseTreeNode {
  public:
    // Copies `count` values; a count below 1 gives an empty list.
    PTNIntegerList(const char* name, int count, const int* values);
    PTNIntegerList(const PTNIntegerList& other);
    PTNIntegerList& operator=(const PTNIntegerList& other);
    ~PTNIntegerList() override;

    // Stores the count through `count` when it is not null. Borrowed; null
    // for a list constructed empty.
    int* GetValue(int* count) const;
    // Copies `count` values (count must not be negative).
    void SetValue(int count, const int* values);
    // One element per white-space separated word; null is taken as "".
    void SetAsString(const char* text);

    const char* GetClassName() const override;
    DWXParseTreeNode* Copy() override;
    char* GetAsString() const override;
    // Takes other's elements only when other has at least one, so the list
    // never empties through a merge.
    void SetFrom(DWXParseTreeNode* other) override;

  private:
    int nCount;
    int* pnValues;
};

// An array of int written with six decimals and read with atof, truncated.
class DWXCORE_API PTNInteger32List : public DWXParseTreeNode {
  public:
    PTNInteger32List(const char* name, int count, const int* values);
    PTNInteger32List(const PTNInteger32List& other);
    PTNInteger32List& operator=(const PTNInteger32List& other);
    ~PTNInteger32List() override;

    int* GetValue(int* count) const;
    void SetValue(int count, const int* values);
    void SetAsString(const char* text);

    const char* GetClassName() const override;
    DWXParseTreeNode* Copy() override;
    char* GetAsString() const override;
    void SetFrom(DWXParseTreeNode* other) override;

  private:
    int nCount;
    int* pnValues;
};

// An array of double written as the shortest text atof reads back.
class DWXCORE_API PTNDoubleList : public DWXParseTreeNode {
  public:
    PTNDoubleList(const char* name, int count, const double* values);
    PTNDoubleList(const PTNDoubleList& other);
    PTNDoubleList& operator=(const PTNDoubleList& other);
    ~PTNDoubleList() override;

    double* GetValue(int* count) const;
    void SetValue(int count, const double* values);
    void SetAsString(const char* text);

    const char* GetClassName() const override;
    DWXParseTreeNode* Copy() override;
    char* GetAsString() const override;
    void SetFrom(DWXParseTreeNode* other) override;

  private:
    int nCount;
    double* pdValues;
};

// ---------------------------------------------------------------------------
// Base64

// The standard alphabet of RFC 4648, with '=' padding and no line breaks.
DWXCORE_API std::string base64_encode(const unsigned char* bytes, unsigned int length);
// Decodes up to the first '=' or byte outside the alphabet; the rest is
// ignored. A final group of two or three characters gives one or two bytes.
DWXCORE_API std::string base64_decode(const std::string& text);

// Byte data kept as Base64 text (owned, null when the node holds no data).
class DWXCORE_API PTNBase64 : public DWXParseTreeNode {
  public:
    // Encodes the data; null data or a length of 0 leaves the node without text.
    PTNBase64(const char* name, const unsigned char* data, unsigned int length);
    PTNBase64(const PTNBase64& other);
    PTNBase64& operator=(const PTNBase64& other);
    ~PTNBase64() override;

    // Decodes `text`, or the node's own text when it is null, into a new
    // buffer of exactly the decoded size; the count goes to *length when
    // length is not null. 0 bytes give a block free() accepts. Caller frees
    // with free().
    unsigned char* Decode(const char* text, unsigned int* length) const;
    // Stores a copy of the text verbatim (no check); null clears the text.
    void SetAsString(const char* text);

    const char* GetClassName() const override;
    // Decodes and encodes afresh, so the copy's text is in canonical form.
    DWXParseTreeNode* Copy() override;
    // The text verbatim; the empty text for a node without text.
    char* GetAsString() const override;
    // Decodes other's text and stores its canonical encoding (no text for 0
    // bytes). With the node itself the data is kept.
    void SetFrom(DWXParseTreeNode* other) override;

  private:
    // base64_encode of the bytes as a heap C string.
    static char* Encode(const unsigned char* data, unsigned int length);

    char* pcText;
};

// ---------------------------------------------------------------------------
// Subtree and merge exceptions

// Names that a merge leaves alone, compared whole and ignoring case. Owns its
// copies of the names. Copies and assignments copy deeply.
class DWXCORE_API ExceptionList {
  public:
    ExceptionList();
    ExceptionList(const ExceptionList& other);
    ExceptionList& operator=(const ExceptionList& other);
    ~ExceptionList();

    // A null name is ignored; a name already present is added again.
    void Add(const char* name);
    // 0 for null.
    int IsMember(const char* name) const;

  private:
    void Append(const char* name);
    void Clear();

    // The merge hashes the names once for its whole walk.
    friend class PTNSubTree;

    char** ppcNames;
    int nCount;
    int nCapacity;
};

// The interior node: an ordered sequence of children of any class, owned and
// deleted with the subtree. Lookups compare whole names ignoring case and
// answer as a walk of the direct children in order would: the first match; a
// null name matches nothing. A subtree of more than a handful of children
// keeps a name index, built on the first lookup and kept up to date from then
// on, so that a lookup by name costs O(1) plus the namesakes it passes, a
// count O(1), and a merge O(children of both trees).
class DWXCORE_API PTNSubTree : public DWXParseTreeNode {
  public:
    explicit PTNSubTree(const char* name);
    // Deep copy: own children whose parent is the new subtree.
    PTNSubTree(const PTNSubTree& other);
    PTNSubTree& operator=(const PTNSubTree& other);
    ~PTNSubTree() override;

    // Appends the node and takes ownership; null is ignored. A node that
    // another subtree (or this one) holds is moved: taken out there and
    // appended here. The subtree itself and its ancestors are refused, since
    // a tree cannot hold itself.
    void AddChild(DWXParseTreeNode* child);
    // Borrowed; for reading and iteration.
    const DWXArray* GetChildren() const { return &oChildren; }

    // The first child of that name whose class name equals `type` ignoring
    // case (any class when `type` is null). Borrowed; null when none.
    DWXParseTreeNode* GetChild(const char* name, const char* type = nullptr) const;

    // The value of the first child of that name. When there is none, or it
    // is not of a class the reader accepts, the default is returned.
    // PTNBool or PTNInteger; default 0.
    int GetChildAsBool(const char* name) const;
    // PTNChar; default 0.
    char GetChildAsChar(const char* name) const;
    // PTNDouble; default 0.0.
    double GetChildAsDouble(const char* name) const;
    // PTNInteger or PTNBool; default 0.
    int GetChildAsInteger(const char* name) const;
    // PTNString; borrowed, null when the child's value is null. The default
    // is a static empty text, never null, not to be freed.
    const char* GetChildAsString(const char* name) const;
    // PTNStringList; borrowed, may be null. Default null.
    char** GetChildAsStringList(const char* name) const;
    // The number of direct children of that name; 0 for null.
    int GetNumberOfOccurence(const char* name) const;

    // The node at `path`: names separated by '/', each compared as GetChild
    // compares and looked up among the children of the subtree the path has
    // reached; "name[N]" takes the N-th child of that name, counting from 0.
    // Null for a null or empty path, a malformed one (an empty segment, an
    // index that is not a decimal number), a step through a leaf, and a name
    // that is not there. Borrowed. Each step costs one GetChild lookup; a
    // step with an index walks that subtree's children once.
    DWXParseTreeNode* Find(const char* path) const;
    // Find, null also when the node is not a T.
    template <class T>
    T* FindAs(const char* path) const {
        return dynamic_cast<T*>(Find(path));
    }

    // The children in order, for range-for: for (DWXParseTreeNode* c : tree).
    DWXRangeIter<DWXParseTreeNode> begin() const {
        return DWXRangeIter<DWXParseTreeNode>(&oChildren);
    }
    DWXRangeIter<DWXParseTreeNode> end() const { return DWXRangeIter<DWXParseTreeNode>(); }

    const char* GetClassName() const override;
    // A deep copy owned by the caller.
    DWXParseTreeNode* Copy() override;
    PTNSubTree* DeepCopy();
    // Does nothing: subtrees merge through the two-argument SetFrom.
    void SetFrom(DWXParseTreeNode* other) override;
    // Merges other's leaf values into this tree: each child not named in
    // `exceptions` takes its value from other's first child of the same name
    // (subtrees recursively). Nothing is added, removed or reordered.
    void SetFrom(PTNSubTree* other, const ExceptionList& exceptions);

    // The lines of this subtree in the text format, indented for `level`
    // (0 or more). Caller frees with DestroyStringList.
    char** GetAsStringList(int level) const;
    // The lines joined into one buffer. Caller frees with free().
    char* GetAsString() const override;
    // Writes the lines at the stream's position; does not flush or close.
    void WriteToFile(FILE* stream) const;

    // Reading from text: defined in dwxparse_reader.cpp.
    // Reads the file that `stream` was opened on (by DKOpen) into this
    // subtree, from its start; a stream DKOpen did not open is read from its
    // own content, and reports then name the source "Memory". A null stream
    // is ignored. The stream is left at its start. A corrupt line outside
    // every subtree raises tzn::Exception; everything read before it stays.
    void BuildFromFile(FILE* stream);
    // The same for a text buffer; null does nothing.
    void BuildFromString(const char* buffer);
    // The same reads with a log (null: as without one). Every report goes to
    // the log instead of IMPError, warnings are added, and the files opened
    // are listed. A corrupt line ends the read as it would without a log, but
    // no exception leaves the call.
    void BuildFromFile(FILE* stream, PTNReadLog* log);
    void BuildFromString(const char* buffer, PTNReadLog* log);
    // Process-wide, off by default. When on, an include with a relative name
    // is looked for first in the directory of the file holding the
    // directive, then in the working directory and the "etc" and "pro" searches.
    static void SetIncludeSearchNextToIncluder(bool on);
    // Reads from `lines` until a closing line or the end of the list.
    // `fileName` names the source in reports (null: "Memory"). Counting starts
    // at *lineCounter and the count is stored back (lineCounter may be null).
    // Returns the position after the closing line, the terminator's position,
    // or null for null lines and for a reading ended by an error inside a
    // nested subtree. Borrowed positions in `lines`.
    char** AddChildrenFromStringList(char** lines, const char* fileName, int* lineCounter);
    // 1 when the line is blank or its first non-white character is '!' or
    // '#'; null counts as empty.
    static int IsCommentOrEmptyLine(const char* line);
    // The index of the first line that is neither empty nor a comment; -1
    // when there is none or lines is null.
    static int FindPossiblePTNTreeStart(const char** lines);
    // Builds nothing and always returns null.
    static PTNSubTree* BuildPTNSubTreeFromStringList(const char** lines);
    // 1 when the stream's first line that is neither empty nor a comment
    // opens a subtree named `name` (ignoring case), else 0; the stream is
    // left at its start. Defined in dwxparse_validate.cpp.
    static int PTNValidateFile(FILE* stream, const char* name);

  private:
    // The children array, which grows from 8 slots rather than DWXArray's
    // 64: most subtrees hold a few leaves, and a large tree holds many of them.
    class ChildArray : public DWXArray {
      public:
        void Append(DWXObject* child);
        // Hands the slot buffer (null when empty) and its top to the caller,
        // who frees it with free(); the array is left empty.
        DWXObject** TakeSlots(int* top);
    };
    struct NameIndex;
    friend class DWXParseTreeNode;
    friend struct PTNTreeBuilder;

    void CopyChildrenFrom(const PTNSubTree& other);
    // Appends a node that has no parent and is no ancestor (the reader's and
    // the copy's new nodes).
    void AppendChild(DWXParseTreeNode* child);
    // The slot of `child`, or -1 when it is not one of the children.
    int SlotOf(const DWXParseTreeNode* child) const;
    // Takes `child` out of the children without deleting it; nothing when it
    // is not one of them.
    void ForgetChild(DWXParseTreeNode* child);
    // The child's name changes to `name`; the index follows.
    void RenameChild(DWXParseTreeNode* child, const char* name);
    // The index, built first when the subtree is large enough to want one;
    // null for a small subtree.
    NameIndex* Index() const;
    void DropIndex();
    // Deletes every descendant and empties the array.
    void DestroyChildren();

    ChildArray oChildren;
    // Owned; never shared with a copy. Built lazily by const lookups.
    mutable NameIndex* poIndex;
};

// File validation: defined in dwxparse_validate.cpp.

// The process-wide registry of current objects: hosts record the current
// object of a kind under a name and find it again by that name.
#pragma once

#include <dwxcore/dwxcore_export.h>
#include <dwxcore/dwxobject.h>
#include <services/portability.h>

#include <map>
#include <string>

namespace dwxcore::internal {

// Orders names byte-wise ignoring ASCII case, so "Doc" and "doc" are one name.
struct NameLessIgnoringCase {
    bool operator()(const std::string& a, const std::string& b) const {
        return _stricmp(a.c_str(), b.c_str()) < 0;
    }
};

}  // namespace dwxcore::internal

// A table of named object pointers that owns the objects recorded in it:
// destroying the table deletes each of them exactly once, also when one object
// is recorded under several names. Names are compared ignoring ASCII case; a
// null name is the empty name.
template <class T>
class CurrentFinder {
  public:
    CurrentFinder();
    // Two tables must never delete the same object, so they are not copied.
    CurrentFinder(const CurrentFinder&) = delete;
    CurrentFinder& operator=(const CurrentFinder&) = delete;
    // Deletes every recorded object once, in the order of the names.
    virtual ~CurrentFinder();

    // Records `object` under `name` and takes ownership of it (null records
    // an empty entry). The object previously recorded under that name is
    // deleted, unless it is the same pointer or still recorded under another
    // name.
    void SetCurrent(const char* name, T* object);
    // The object recorded under `name`, or null. Borrowed; the table keeps it.
    T* GetCurrent(const char* name) const;
    // Removes the entry and hands its object back to the caller, who owns it
    // from then on; every other entry holding the same object is removed too.
    // Null when the name is absent.
    T* ReleaseCurrent(const char* name);

  protected:
    std::map<std::string, T*, dwxcore::internal::NameLessIgnoringCase> moObjects;
};

extern template class DWXCORE_API CurrentFinder<DWXObject>;

// The one registry the library hands out. It is made on first request and
// deleted, with every object it holds, at process exit; a request after that
// makes a fresh, empty registry. Any thread may ask for it; its table has no
// lock, so no thread may change it while another uses it.
class DWXCORE_API DWXCurrentFinder : public CurrentFinder<DWXObject> {
  public:
    ~DWXCurrentFinder() override;

    // The registry, created on the first call.
    static DWXCurrentFinder* GetInstance();

  protected:
    // Registers ExitCB to run at process exit.
    DWXCurrentFinder();
    // Deletes the registry and the objects it holds; the next GetInstance
    // makes a new one.
    static void ExitCB();

  private:
    static DWXCurrentFinder* mpoUniqueInstance;
};

// The same as DWXCurrentFinder::GetInstance().
DWXCORE_API DWXCurrentFinder* GetDWXCurrentFinder();

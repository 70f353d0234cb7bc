// The object root, the container and iteration protocol, and the containers
// of object pointers. Containers never own their members; only
// DestroyContents deletes them.
#pragma once

#include <dwxcore/dwxcore_export.h>

#include <stdio.h>

// Root of every class with an identity. Deleting through a DWXObject* is safe.
class DWXCORE_API DWXObject {
  public:
    DWXObject() {}
    DWXObject(const DWXObject&) {}
    DWXObject& operator=(const DWXObject&) { return *this; }
    virtual ~DWXObject();

    // Writes "ClassName:address\n".
    virtual void Dump(FILE* stream) const;
    // The class name as a literal; parse tree writers turn it into a keyword.
    virtual const char* GetClassName() const = 0;
};

#include <dwxcore/dwxobject.h>

DWXObject::~DWXObject() {}

void DWXObject::Dump(FILE* stream) const {
    fprintf(stream, "%s:%p\n", GetClassName(), (const void*)this);
}

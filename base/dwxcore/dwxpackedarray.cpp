#include <dwxcore/dwxobject.h>

#include <stdlib.h>

DWXPackedArray::DWXPackedArray() {}

DWXPackedArray::DWXPackedArray(const DWXContainer* container) : DWXArray(container) {}

DWXPackedArray::DWXPackedArray(const DWXPackedArray& other) : DWXArray(other) {}

DWXPackedArray& DWXPackedArray::operator=(const DWXPackedArray& other) {
    DWXArray::operator=(other);
    return *this;
}

DWXPackedArray::~DWXPackedArray() {}

const char* DWXPackedArray::GetClassName() const {
    return "DWXPackedArray";
}

int DWXPackedArray::Remove(const DWXObject* object) {
    int index = GetIndex(object);
    if (index < 0) {
        return 0;
    }
    // Trailing empty slots (left by SetAt) are dropped first, so that it is
    // the last member, not an empty slot, that fills the gap.
    GetMaxIndex();
    int last = nTop - 1;
    if (index < last) {
        ppoItems[index] = ppoItems[last];
    }
    ppoItems[last] = nullptr;
    --nTop;
    if (--nCount == 0) {
        free(ppoItems);
        ppoItems = nullptr;
        nCapacity = nTop = 0;
    }
    return 1;
}

// Containers hold object pointers and never own them: the host deletes the
// members (here with DestroyContents) or keeps them elsewhere.
#include <dwxcore/dwxobject.h>

#include <stdio.h>
#include <string.h>

#include <string>

// A host class: every object kept in a container derives from DWXObject.
class Photo : public DWXObject, public DWXValidatable {
  public:
    Photo(const char* name, int width) : oName(name), nWidth(width) {}
    const char* GetClassName() const override { return "Photo"; }
    int Validate() const override { return nWidth > 0; }
    const char* Name() const { return oName.c_str(); }

  private:
    std::string oName;
    int nWidth;
};

static int ByName(const void* a, const void* b) {
    const Photo* left = static_cast<const Photo*>(*static_cast<DWXObject* const*>(a));
    const Photo* right = static_cast<const Photo*>(*static_cast<DWXObject* const*>(b));
    return strcmp(left->Name(), right->Name());
}

int main() {
    DWXArray photos;
    photos.Add(new Photo("night sky", 4000));
    photos.Add(new Photo("harbour", 3000));
    photos.Add(new Photo("garden", 2000));
    photos.Sort(ByName);

    // Walk with an iterator; every container answers the same protocol.
    DWXIter iter(&photos);
    for (DWXObject* object = iter.Start(); object; object = iter.Next()) {
        printf("%s\n", static_cast<Photo*>(object)->Name());
    }

    // A second container may share the members without owning them.
    DWXLinkedList favourites;
    favourites.Append(photos[0]);
    printf("%d photos, %d favourite, all valid: %d\n", photos.GetCount(), favourites.GetCount(),
           photos.Validate());

    favourites.Empty();        // forgets its members
    photos.DestroyContents();  // deletes them, each once
    return 0;
}

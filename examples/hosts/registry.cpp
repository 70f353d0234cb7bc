// The registry of current objects: one object per name, owned by the
// registry and deleted at process exit unless released.
#include <dwxcore/dwxcurrentfinder.h>
#include <dwxcore/dwxstring.h>

#include <stdio.h>

class Document : public DWXObject {
  public:
    explicit Document(const char* name) : oName(name) {}
    ~Document() override { printf("closing %s\n", static_cast<const char*>(oName)); }
    const char* GetClassName() const override { return "Document"; }
    const char* Name() const { return oName; }

  private:
    DWXString oName;
};

int main() {
    DWXCurrentFinder* registry = GetDWXCurrentFinder();
    registry->SetCurrent("document", new Document("harbour.jpg"));
    auto* current = static_cast<Document*>(registry->GetCurrent("Document"));
    printf("current %s\n", current->Name());

    registry->SetCurrent("document", new Document("garden.jpg"));  // deletes harbour.jpg
    DWXObject* mine = registry->ReleaseCurrent("document");        // ours again
    delete mine;
    registry->SetCurrent("palette", new Document("warm colours"));  // deleted at exit
    return 0;
}

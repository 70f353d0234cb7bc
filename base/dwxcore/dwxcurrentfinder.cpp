#include <dwxcore/dwxcurrentfinder.h>

#include <services/utilhub.h>

#include <mutex>
#include <set>
#include <utility>

namespace {

// Guards making and dropping the singleton, so that first requests from
// several threads make one registry. The table itself has no lock.
std::mutex gInstanceLock;

std::string NameOf(const char* name) {
    return name != nullptr ? std::string(name) : std::string();
}

template <class Map, class T>
bool IsRecorded(const Map& table, const T* object) {
    for (const auto& entry : table) {
        if (entry.second == object) {
            return true;
        }
    }
    return false;
}

}  // namespace

template <class T>
CurrentFinder<T>::CurrentFinder() {}

// The table is emptied before any object is deleted, so a destructor that
// reaches back into the registry finds no dangling entry.
template <class T>
CurrentFinder<T>::~CurrentFinder() {
    auto table = std::move(moObjects);
    moObjects.clear();
    std::set<T*> deleted;
    for (auto& entry : table) {
        if (entry.second != nullptr && deleted.insert(entry.second).second) {
            delete entry.second;
        }
    }
}

template <class T>
void CurrentFinder<T>::SetCurrent(const char* name, T* object) {
    T*& slot = moObjects[NameOf(name)];
    T* previous = slot;
    slot = object;
    if (previous != nullptr && previous != object && !IsRecorded(moObjects, previous)) {
        delete previous;
    }
}

template <class T>
T* CurrentFinder<T>::GetCurrent(const char* name) const {
    auto found = moObjects.find(NameOf(name));
    return found != moObjects.end() ? found->second : nullptr;
}

template <class T>
T* CurrentFinder<T>::ReleaseCurrent(const char* name) {
    auto found = moObjects.find(NameOf(name));
    if (found == moObjects.end()) {
        return nullptr;
    }
    T* object = found->second;
    moObjects.erase(found);
    if (object != nullptr) {
        for (auto it = moObjects.begin(); it != moObjects.end();) {
            it = (it->second == object) ? moObjects.erase(it) : std::next(it);
        }
    }
    return object;
}

// The header's extern declaration carries the export attribute; GCC and Clang
// take it from there, MSVC wants it on the definition as well.
#if defined(_WIN32)
template class DWXCORE_API CurrentFinder<DWXObject>;
#else
template class CurrentFinder<DWXObject>;
#endif

DWXCurrentFinder* DWXCurrentFinder::mpoUniqueInstance = nullptr;

DWXCurrentFinder::DWXCurrentFinder() {
    _IMPAtExit(&DWXCurrentFinder::ExitCB, "base/dwxcore/dwxcurrentfinder", 10);
}

DWXCurrentFinder::~DWXCurrentFinder() {}

// Constant time: one uncontended lock.
DWXCurrentFinder* DWXCurrentFinder::GetInstance() {
    std::lock_guard<std::mutex> guard(gInstanceLock);
    if (mpoUniqueInstance == nullptr) {
        mpoUniqueInstance = new DWXCurrentFinder;
    }
    return mpoUniqueInstance;
}

// The singleton is detached before it is deleted, so an object's destructor
// that asks for the registry never gets the one being destroyed.
void DWXCurrentFinder::ExitCB() {
    DWXCurrentFinder* registry;
    {
        std::lock_guard<std::mutex> guard(gInstanceLock);
        registry = mpoUniqueInstance;
        mpoUniqueInstance = nullptr;
    }
    delete registry;
}

DWXCurrentFinder* GetDWXCurrentFinder() {
    return DWXCurrentFinder::GetInstance();
}

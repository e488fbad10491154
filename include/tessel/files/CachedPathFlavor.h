// What a host that knows whether an item exists may cache about its path, under kPathFlavorKey, so that queries about a
// missing item need not touch the disk.
#ifndef TESSEL_FILES_CACHEDPATHFLAVOR_H
#define TESSEL_FILES_CACHEDPATHFLAVOR_H

#include <tessel/paths/PathCachedItem.h>

#ifdef __cplusplus
#    include <cstring>

namespace tessel {

// The key that the item is cached under.
inline constexpr char kPathFlavorKey[] = "FExists";

// Says whether the item at a path is a file, a folder, or not there.
class CachedPathFlavor : public PathRef::CachedItem {
public:
    // Neither a file nor a folder: there is no such item, nor anything below it.
    CachedPathFlavor(uint32 lifetime, RelationToMetaData relation, bool isFile, bool isFolder)
        : CachedItem(lifetime, relation), isFile_(isFile), isFolder_(isFolder) {}

    bool IsA(const char* className) const override {
        return std::strcmp(className, ClassName()) == 0 || CachedItem::IsA(className);
    }
    uint32 Size() const override { return sizeof *this; }
    // Whether it is a file.
    bool IsFile() const { return isFile_ != 0; }
    // Whether it is a folder.
    bool IsFolder() const { return isFolder_ != 0; }
    // The name that IsA and PathRef::GetCachedProxy know the class by.
    static const char* ClassName() { return "CachedPathFlavor"; }

private:
    uint8 isFile_;
    uint8 isFolder_;
};

}  // namespace tessel
#endif

#endif

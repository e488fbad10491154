// What a path can have cached about itself (PathRef::Cache): an item with a lifetime, and items that hold a value.
//
// A host derives its own from PathRef::CachedItem. Lifetimes are milliseconds; 2^31 - 1 is the
// longest, and longer ones become it. The library calls an item, and deletes it, with no lock of its own held, on any
// thread.
#ifndef TESSEL_PATHS_PATHCACHEDITEM_H
#define TESSEL_PATHS_PATHCACHEDITEM_H

#include <tessel/paths/PathRef.h>

#ifdef __cplusplus
#    include <tessel/memory/TrackedMallocFree.h>

namespace tessel {

class TESSEL_API PathRef::CachedItem : public TrackedObject {
public:
    enum RelationToMetaData : int32 {
        kDependsOnFile = 0,  // dropped by FlushCache, that is whenever the library changes the file
        kIndependent = 1     // stays until it expires
    };

    CachedItem(uint32 lifetime, RelationToMetaData relation);

    virtual bool IsA(const char* className) const;  // true for the item's own class and for "CachedItem"
    virtual ~CachedItem();
    virtual bool Expired() const;
    virtual bool Invalidate() const;  // whether FlushCache drops it
    virtual void Reset(uint32 lifetime);
    virtual uint32 Size() const;    // bytes of memory
    virtual uint32 Rotten() const;  // milliseconds since it expired; 0 before
    virtual void Attached();        // called when the item has been stored

    CachedItem(const CachedItem&) = delete;
    CachedItem& operator=(const CachedItem&) = delete;

    static const char* ClassName();

private:
    uint32 expiry_;
    uint8 invalidate_;
};

class TESSEL_API PathRef::CachedBool : public PathRef::CachedItem {
public:
    CachedBool(uint32 lifetime, RelationToMetaData relation, bool value);
    ~CachedBool() override;
    bool IsA(const char* className) const override;
    uint32 Size() const override;
    virtual void ResetBool(uint32 lifetime, bool value);
    bool Get() const { return value_; }
    static const char* ClassName();

private:
    bool value_;
};

class TESSEL_API PathRef::CachedInt32 : public PathRef::CachedItem {
public:
    CachedInt32(uint32 lifetime, RelationToMetaData relation, int32 value);
    ~CachedInt32() override;
    bool IsA(const char* className) const override;
    uint32 Size() const override;
    virtual void ResetInt32(uint32 lifetime, int32 value);
    int32 Get() const { return value_; }
    static const char* ClassName();

private:
    int32 value_;
};

class TESSEL_API PathRef::CachedPathString : public PathRef::CachedItem {
public:
    CachedPathString(uint32 lifetime, RelationToMetaData relation, const StringType& value);
    ~CachedPathString() override;
    bool IsA(const char* className) const override;
    uint32 Size() const override;
    virtual void ResetString(uint32 lifetime, const StringType& value);
    const StringType& Get() const { return value_; }
    static const char* ClassName();

private:
    StringType value_;
};

class TESSEL_API PathRef::CachedPath : public PathRef::CachedItem {
public:
    CachedPath(uint32 lifetime, RelationToMetaData relation, const PathRef& value);
    ~CachedPath() override;
    bool IsA(const char* className) const override;
    uint32 Size() const override;
    virtual void ResetPath(uint32 lifetime, const PathRef& value);
    const PathRef& Get() const { return value_; }
    static const char* ClassName();

private:
    PathRef value_;
};

}  // namespace tessel
#endif

#endif

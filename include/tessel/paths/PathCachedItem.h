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

#    include <type_traits>

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

// What the items that hold a value have in common. `Item` is the class that derives from it.
template <class Item, class Value>
class TESSEL_API PathRef::CachedValue : public PathRef::CachedItem {
public:
    using Argument = std::conditional_t<std::is_scalar_v<Value>, Value, const Value&>;

    bool IsA(const char* className) const override;
    uint32 Size() const override;
    Argument Get() const { return value_; }

protected:
    CachedValue(uint32 lifetime, RelationToMetaData relation, Argument value);
    ~CachedValue() override;
    void ResetValue(uint32 lifetime, Argument value);

private:
    Value value_;
};

extern template class PathRef::CachedValue<PathRef::CachedBool, bool>;
extern template class PathRef::CachedValue<PathRef::CachedInt32, int32>;
extern template class PathRef::CachedValue<PathRef::CachedPathString, PathRef::StringType>;
extern template class PathRef::CachedValue<PathRef::CachedPath, PathRef>;

class TESSEL_API PathRef::CachedBool : public PathRef::CachedValue<PathRef::CachedBool, bool> {
public:
    CachedBool(uint32 lifetime, RelationToMetaData relation, bool value);
    ~CachedBool() override;
    virtual void ResetBool(uint32 lifetime, bool value);
    static const char* ClassName();
};

class TESSEL_API PathRef::CachedInt32 : public PathRef::CachedValue<PathRef::CachedInt32, int32> {
public:
    CachedInt32(uint32 lifetime, RelationToMetaData relation, int32 value);
    ~CachedInt32() override;
    virtual void ResetInt32(uint32 lifetime, int32 value);
    static const char* ClassName();
};

class TESSEL_API PathRef::CachedPathString
    : public PathRef::CachedValue<PathRef::CachedPathString, PathRef::StringType> {
public:
    CachedPathString(uint32 lifetime, RelationToMetaData relation, const StringType& value);
    ~CachedPathString() override;
    uint32 Size() const override;
    virtual void ResetString(uint32 lifetime, const StringType& value);
    static const char* ClassName();
};

class TESSEL_API PathRef::CachedPath : public PathRef::CachedValue<PathRef::CachedPath, PathRef> {
public:
    CachedPath(uint32 lifetime, RelationToMetaData relation, const PathRef& value);
    ~CachedPath() override;
    virtual void ResetPath(uint32 lifetime, const PathRef& value);
    static const char* ClassName();
};

}  // namespace tessel
#endif

#endif

// What a path can have cached about itself (PathRef::Cache): an item with a lifetime, and items that hold a value.
//
// A host derives its own from PathRef::CachedItem. Lifetimes are milliseconds; 2^31 - 1 is the longest, and longer ones
// become it. The library calls an item, and deletes it, with no lock of its own held, on any thread.
#ifndef TESSEL_PATHS_PATHCACHEDITEM_H
#define TESSEL_PATHS_PATHCACHEDITEM_H

#include <tessel/paths/PathRef.h>

#ifdef __cplusplus
#    include <tessel/memory/TrackedMallocFree.h>

#    include <type_traits>

namespace tessel {

// What can be cached about a path: a base for items of any kind.
class TESSEL_API PathRef::CachedItem : public TrackedObject {
public:
    enum RelationToMetaData : int32 {
        kDependsOnFile = 0,  // dropped by FlushCache, that is whenever the library changes the file
        kIndependent = 1     // stays until it expires
    };

    // An item that expires after so many milliseconds.
    CachedItem(uint32 lifetime, RelationToMetaData relation);

    // True for the item's own class and for "CachedItem".
    virtual bool IsA(const char* className) const;
    virtual ~CachedItem();
    // Whether its lifetime is over.
    virtual bool Expired() const;
    // Whether FlushCache drops it.
    virtual bool Invalidate() const;
    // Begins a new lifetime.
    virtual void Reset(uint32 lifetime);
    // Bytes of memory.
    virtual uint32 Size() const;
    // Milliseconds since it expired; 0 before.
    virtual uint32 Rotten() const;
    // Called when the item has been stored.
    virtual void Attached();

    CachedItem(const CachedItem&) = delete;
    CachedItem& operator=(const CachedItem&) = delete;

    // The name that IsA knows this class by: "CachedItem".
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
    // The value. A reference is good until the item is reset or dropped.
    Argument Get() const { return value_; }

protected:
    CachedValue(uint32 lifetime, RelationToMetaData relation, Argument value);
    ~CachedValue() override = default;
    void ResetValue(uint32 lifetime, Argument value);

private:
    Value value_;
};

extern template class PathRef::CachedValue<PathRef::CachedBool, bool>;
extern template class PathRef::CachedValue<PathRef::CachedInt32, int32>;
extern template class PathRef::CachedValue<PathRef::CachedPathString, PathRef::StringType>;
extern template class PathRef::CachedValue<PathRef::CachedPath, PathRef>;

// Holds a truth value.
class TESSEL_API PathRef::CachedBool : public PathRef::CachedValue<PathRef::CachedBool, bool> {
public:
    // An item with that value.
    CachedBool(uint32 lifetime, RelationToMetaData relation, bool value);
    ~CachedBool() override;
    // Begins a new lifetime with another value.
    virtual void ResetBool(uint32 lifetime, bool value);
    // The name that IsA knows this class by: "CachedBool".
    static const char* ClassName();
};

// Holds a number.
class TESSEL_API PathRef::CachedInt32 : public PathRef::CachedValue<PathRef::CachedInt32, int32> {
public:
    // An item with that value.
    CachedInt32(uint32 lifetime, RelationToMetaData relation, int32 value);
    ~CachedInt32() override;
    // Begins a new lifetime with another value.
    virtual void ResetInt32(uint32 lifetime, int32 value);
    // The name that IsA knows this class by: "CachedInt32".
    static const char* ClassName();
};

// Holds a text.
class TESSEL_API PathRef::CachedPathString
    : public PathRef::CachedValue<PathRef::CachedPathString, PathRef::StringType> {
public:
    // An item with a copy of the text.
    CachedPathString(uint32 lifetime, RelationToMetaData relation, const StringType& value);
    ~CachedPathString() override;
    uint32 Size() const override;
    // Begins a new lifetime with another text.
    virtual void ResetString(uint32 lifetime, const StringType& value);
    // The name that IsA knows this class by: "CachedPathString".
    static const char* ClassName();
};

// Holds a path.
class TESSEL_API PathRef::CachedPath : public PathRef::CachedValue<PathRef::CachedPath, PathRef> {
public:
    // An item with a copy of the path.
    CachedPath(uint32 lifetime, RelationToMetaData relation, const PathRef& value);
    ~CachedPath() override;
    // Begins a new lifetime with another path.
    virtual void ResetPath(uint32 lifetime, const PathRef& value);
    // The name that IsA knows this class by: "CachedPath".
    static const char* ClassName();
};

}  // namespace tessel
#endif

#endif

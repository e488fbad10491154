// The folders of the registry's store, and whose turn it is to change them. See Registry.cpp for what lies where.
#ifndef TESSEL_PLATFORM_POSIX_REGISTRYSTORE_H
#define TESSEL_PLATFORM_POSIX_REGISTRYSTORE_H

#include "platform/posix/Errors.h"
#include "platform/posix/Interrupted.h"

#include <memory>
#include <string>
#include <string_view>
#include <utility>

namespace tessel::platform {

// A folder that is held open, to name what is in it from there. Without one, `Number` is -1 and errno said why.
class Folder {
public:
    Folder() = default;
    Folder(int from, const char* name, int flags)
        : number_(OpenAtRetrying(from, name, flags | O_DIRECTORY | O_NONBLOCK, 0)) {}
    Folder(Folder&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
    Folder& operator=(Folder&& other) noexcept {
        std::swap(number_, other.number_);
        return *this;
    }
    ~Folder() {
        const int error = errno;
        if (number_ >= 0) systemCalls.close(number_);
        errno = error;
    }

    explicit operator bool() const { return number_ >= 0; }
    int Number() const { return number_; }

    // A key's folder in this one. It is a folder itself: a link might lead out of the store, and what is deleted must
    // lie within.
    Folder Key(const std::string& name) const { return Folder(number_, name.c_str(), O_PATH | O_NOFOLLOW); }

    // Calls visit(entry) for all that is in it. False with errno when not all could be had.
    template <typename Visitor>
    bool Visit(Visitor visit) const;

    // Puts what was made, renamed and deleted in it onto the device. False with errno.
    bool Flush() const;

private:
    int number_ = -1;
};

template <typename Visitor>
bool Folder::Visit(Visitor visit) const {
    const int number = OpenAtRetrying(number_, ".", O_RDONLY | O_DIRECTORY, 0);
    if (number < 0) return false;
    const std::unique_ptr<DIR, int (*)(DIR*)> listing(systemCalls.fdopendir(number), systemCalls.closedir);
    if (!listing) {
        const int error = errno;
        systemCalls.close(number);
        errno = error;
        return false;
    }
    return VisitListing(listing.get(), [&](DIR*, const dirent& entry) {
        const std::string_view name = entry.d_name;
        if (name != "." && name != "..") visit(entry);
        return true;
    });
}

// Held by whoever changes a store, in whatever process: so no two make one name in two spellings, and no key goes while
// a value is put into it. Where there are no locks (a file system without them) things go on without. Who holds it
// clears what others left on their way when they ended.
class StoreLock {
public:
    // `store` is made when it is missing; `root`, the folder that the change lies in, need not be there.
    StoreLock(const std::string& store, const std::string& root);
    ~StoreLock();
    StoreLock(const StoreLock&) = delete;
    StoreLock& operator=(const StoreLock&) = delete;

    // Why nothing may be changed: it cannot be opened, or its holder does not give it back (1460). 0 when it is held.
    ErrorNumber Error() const { return error_; }

private:
    bool Open(const std::string& name);
    bool Wait();
    bool Leads(const std::string& name);

    int file_ = -1;
    bool isShared_ = true;  // locks bind others here
    ErrorNumber error_ = kErrorSuccess;
};

// The place beside the keys of a root for what is being made or deleted; under the lock. What is in it belongs to
// nobody once its maker has ended.
class Aside {
public:
    // Makes the place in the root's folder. Without one, errno said why.
    explicit Aside(const std::string& root);
    // Takes the place away if it is empty.
    ~Aside();
    Aside(const Aside&) = delete;
    Aside& operator=(const Aside&) = delete;

    explicit operator bool() const { return static_cast<bool>(place_); }
    const Folder& Place() const { return place_; }

    // A name that is free in it.
    std::string NewName();

    // Deletes an item of a folder with all that it holds, at once: it goes aside first, and stays where it was when
    // that cannot be put onto the device. What cannot be deleted then is left to the next. False with errno.
    bool Delete(const Folder& folder, const std::string& item);

    // Deletes all that is in it, however deep, as far as that can be had.
    void Empty() noexcept;

private:
    bool Clear(const std::string& item);

    Folder root_, place_;
    unsigned number_ = 0;
};

}  // namespace tessel::platform

#endif

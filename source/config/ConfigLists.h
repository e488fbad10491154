// Lists in settings: as text between semicolons, and in handles.
#ifndef TESSEL_SOURCE_CONFIG_CONFIGLISTS_H
#define TESSEL_SOURCE_CONFIG_CONFIGLISTS_H

#include <tessel/base/OVExcept.h>
#include <tessel/memory/MemoryManager.h>

#include <cstring>
#include <list>
#include <string>
#include <string_view>
#include <vector>

namespace tessel {

// The texts between the semicolons; none of an empty text.
std::vector<std::string> SplitTexts(std::string_view text);
std::string JoinTexts(const std::vector<std::string>& elements);

// The same where a backslash has the next byte stand for itself. One at the very end stands for itself too.
std::vector<std::string> SplitEscaped(std::string_view text);
std::string JoinEscaped(const std::vector<std::string>& elements);

// The list in a handle: an int32 count, and elements, which are taken off one after the other.
class HandleView {
public:
    // The elements begin after `header` bytes.
    explicit HandleView(UHandle handle, size_t header = sizeof(int32)) {
        size_t size = DSGetHandleSize(handle);
        if (size < header) return;
        std::memcpy(&count_, *handle, sizeof count_);
        rest_ = {reinterpret_cast<const char*>(*handle) + header, size - header};
        // Every element takes at least one byte.
        if (count_ < 0 || static_cast<size_t>(count_) > rest_.size()) TESSEL_THROW(kArgErr, "List is damaged");
    }
    int32 Count() const { return count_; }
    // Raises kArgErr when the handle ends before.
    std::string_view Take(size_t bytes) {
        if (bytes > rest_.size()) TESSEL_THROW(kArgErr, "List is damaged");
        std::string_view taken = rest_.substr(0, bytes);
        rest_.remove_prefix(bytes);
        return taken;
    }

private:
    int32 count_ = 0;
    std::string_view rest_;
};

}  // namespace tessel

#endif

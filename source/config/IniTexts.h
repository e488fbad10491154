// Bytes that texts of a document lie in: they stay where they are as long as the object lives.
#ifndef TESSEL_SOURCE_CONFIG_INITEXTS_H
#define TESSEL_SOURCE_CONFIG_INITEXTS_H

#include <tessel/memory/TrackedMallocFree.h>

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <memory>
#include <string_view>
#include <vector>

namespace tessel {

class IniTexts {
public:
    // Raises std::bad_alloc, as all that makes room.
    char* Allocate(std::size_t size) {
        if (size > left_) AddBlock(std::max(size, kBlockSize));
        char* const text = next_;
        next_ += size;
        left_ -= size;
        used_ += size;
        return text;
    }
    std::string_view Keep(std::string_view text) {
        if (text.empty()) return {};
        char* const kept = Allocate(text.size());
        std::memcpy(kept, text.data(), text.size());
        return {kept, text.size()};
    }
    // Bytes handed out, those that nobody needs any more among them.
    std::size_t Used() const { return used_; }

private:
    static constexpr std::size_t kBlockSize = 4096;

    struct Freer {
        void operator()(void* block) const { TrackedFree(block); }
    };
    using Block = std::unique_ptr<char, Freer>;

    void AddBlock(std::size_t size) {
        Block block(static_cast<char*>(TrackedNew(size)));
        blocks_.push_back(std::move(block));
        next_ = blocks_.back().get();
        left_ = size;
    }

    std::vector<Block, TrackedAllocator<Block>> blocks_;
    char* next_ = nullptr;
    std::size_t left_ = 0;
    std::size_t used_ = 0;
};

}  // namespace tessel

#endif

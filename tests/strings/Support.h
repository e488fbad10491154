// Texts in the library's forms, for the tests of this folder.
#pragma once

#include "platform/CodePage.h"
#include <tessel/memory/MemoryManager.h>
#include <tessel/strings/StringLStr.h>

#include <gtest/gtest.h>
#include <string>
#include <string_view>
#include <vector>

namespace tessel::test {

// A PStr in a buffer that takes any.
class P {
public:
    P(std::string_view text = "") { text_[0] = static_cast<uint8>(text.copy(reinterpret_cast<char*>(text_ + 1), 255)); }
    operator PStr() { return text_; }
    std::string Text() const { return {reinterpret_cast<const char*>(text_ + 1), text_[0]}; }

private:
    Str255 text_ = {0};
};

inline std::string TextOf(ConstPStr text) {
    return {reinterpret_cast<const char*>(text + 1), text[0]};
}

inline std::string TextOf(const LStr* text) {
    return text ? std::string(reinterpret_cast<const char*>(text->bytes), static_cast<size_t>(text->count)) : "";
}

// An LStr handle; null for the empty text unless it is asked for.
class L {
public:
    L() = default;
    explicit L(std::string_view text) {
        EXPECT_EQ(kNoErr, LStrFromPtr(&handle_, static_cast<int32>(text.size()), text.data()));
    }
    L(const L&) = delete;
    L& operator=(const L&) = delete;
    ~L() { DSDisposeHandle(reinterpret_cast<UHandle>(handle_)); }

    operator LStrHandle() { return handle_; }
    LStrHandle* operator&() { return &handle_; }
    std::string Text() const { return TextOf(handle_ ? *handle_ : nullptr); }
    uint32 Size() const { return DSGetHandleSize(reinterpret_cast<UHandle>(handle_)); }

private:
    LStrHandle handle_ = nullptr;
};

// Makes a code page the active one for the scope.
class CodePage {
public:
    explicit CodePage(uint32 page) : before_(platform::ActiveCodePage().codePage) {
        EXPECT_TRUE(platform::SetCodePage(page));
    }
    ~CodePage() { platform::SetCodePage(before_); }
    CodePage(const CodePage&) = delete;
    CodePage& operator=(const CodePage&) = delete;

private:
    const uint32 before_;
};

inline int Sign(int32 order) {
    return (order > 0) - (order < 0);
}

}  // namespace tessel::test


// Writes one JSON document.
#ifndef TESSEL_TOOLS_JSON_H
#define TESSEL_TOOLS_JSON_H

#include <cstdio>
#include <string>

namespace tool {

class Json {
public:
    // '{' or '[', and '}' or ']'.
    Json& Begin(char bracket) {
        Separate();
        text_ += bracket;
        first_ = true;
        return *this;
    }
    void End(char bracket) {
        text_ += bracket;
        first_ = false;
    }
    Json& Key(const std::string& name) {
        String(name);
        text_ += ": ";
        first_ = true;
        return *this;
    }
    void Number(long long value) {
        Separate();
        text_ += std::to_string(value);
    }
    // One character for each byte, escaped outside printable ASCII.
    void String(const std::string& bytes) {
        Separate();
        text_ += '"';
        for (const char c : bytes) {
            if (c >= 0x20 && c < 0x7F && c != '"' && c != '\\') {
                text_ += c;
            } else {
                char escape[8];
                std::snprintf(escape, sizeof escape, "\\u%04x", static_cast<unsigned>(static_cast<unsigned char>(c)));
                text_ += escape;
            }
        }
        text_ += '"';
    }
    void Hex(const std::string& bytes) {
        static constexpr char kDigits[] = "0123456789abcdef";
        Separate();
        text_ += '"';
        for (const char c : bytes) {
            text_ += kDigits[static_cast<unsigned char>(c) >> 4];
            text_ += kDigits[static_cast<unsigned char>(c) & 15];
        }
        text_ += '"';
    }
    const std::string& Text() const { return text_; }

private:
    void Separate() {
        if (!first_) text_ += ", ";
        first_ = false;
    }

    std::string text_;
    bool first_ = true;
};

}  // namespace tool

#endif

// Lists of texts between semicolons.
#include "config/ConfigLists.h"

namespace tessel {
namespace {

constexpr char kBetween = ';';
constexpr char kEscape = '\\';

std::vector<std::string> Split(std::string_view text, bool escaped) {
    std::vector<std::string> elements;
    if (text.empty()) return elements;
    elements.emplace_back();
    for (size_t i = 0; i < text.size(); ++i) {
        if (text[i] == kBetween) {
            elements.emplace_back();
            continue;
        }
        if (escaped && text[i] == kEscape && i + 1 < text.size()) ++i;
        elements.back() += text[i];
    }
    return elements;
}

std::string Join(const std::vector<std::string>& elements, bool escaped) {
    std::string text;
    for (size_t i = 0; i < elements.size(); ++i) {
        if (i > 0) text += kBetween;
        for (char c : elements[i]) {
            if (escaped && (c == kBetween || c == kEscape)) text += kEscape;
            text += c;
        }
    }
    return text;
}

}  // namespace

std::vector<std::string> SplitTexts(std::string_view text) {
    return Split(text, false);
}
std::string JoinTexts(const std::vector<std::string>& elements) {
    return Join(elements, false);
}
std::vector<std::string> SplitEscaped(std::string_view text) {
    return Split(text, true);
}
std::string JoinEscaped(const std::vector<std::string>& elements) {
    return Join(elements, true);
}

}  // namespace tessel

// Numbers in settings.
#include "config/ConfigNumbers.h"

#include "config/ConfigText.h"

#include <charconv>
#include <cmath>

namespace tessel {
namespace {

// Takes white space and a sign off the text.
bool TakeMinus(std::string_view* text) {
    text->remove_prefix(std::min(text->find_first_not_of(kWhiteSpace), text->size()));
    bool minus = text->starts_with('-');
    if (minus || text->starts_with('+')) text->remove_prefix(1);
    return minus;
}

bool IsHex(std::string_view text) {
    if (text.size() < 3 || text[0] != '0' || (text[1] | 32) != 'x') return false;
    size_t first = text[2] == '.' ? 3 : 2;
    return first < text.size() && std::string_view("0123456789abcdefABCDEF").find(text[first]) != text.npos;
}

// Whether the number, which is beyond what a real holds, is too large rather than too small: by the place of its first
// digit that is not 0, and its exponent.
bool IsHuge(std::string_view number, std::string_view exponentMark, int placeWeight) {
    size_t mark = number.find_first_of(exponentMark);
    std::string_view digits = number.substr(0, mark);
    int32 exponent = 0;
    if (mark != number.npos) {
        number.remove_prefix(mark + 1);
        ParseInt32(&number, &exponent);
    }
    size_t point = std::min(digits.find('.'), digits.size());
    size_t first = digits.find_first_not_of("0.");
    auto places = static_cast<int64>(point) - static_cast<int64>(first);
    return places * placeWeight + exponent > 0;
}

}  // namespace

bool ParseInt32(std::string_view* text, int32* value) {
    std::string_view rest = *text;
    bool minus = TakeMinus(&rest);
    uint64 magnitude = 0;
    auto [end, err] = std::from_chars(rest.data(), rest.data() + rest.size(), magnitude);
    if (err == std::errc::invalid_argument) return false;
    uint64 most = static_cast<uint64>(std::numeric_limits<int32>::max()) + (minus ? 1 : 0);
    if (err == std::errc::result_out_of_range || magnitude > most) magnitude = most;
    auto signedValue = static_cast<int64>(magnitude);
    *value = static_cast<int32>(minus ? -signedValue : signedValue);
    text->remove_prefix(static_cast<size_t>(end - text->data()));
    return true;
}

bool ParseFloat32(std::string_view text, float* value) {
    bool minus = TakeMinus(&text);
    if (text.starts_with('-')) return false;  // from_chars would take a second sign
    bool hex = IsHex(text);
    if (hex) text.remove_prefix(2);
    float magnitude = 0;
    auto format = hex ? std::chars_format::hex : std::chars_format::general;
    auto [end, err] = std::from_chars(text.data(), text.data() + text.size(), magnitude, format);
    if (err == std::errc::invalid_argument) return false;
    if (err == std::errc::result_out_of_range) {
        std::string_view number = text.substr(0, static_cast<size_t>(end - text.data()));
        bool huge = hex ? IsHuge(number, "pP", 4) : IsHuge(number, "eE", 1);
        magnitude = huge ? std::numeric_limits<float>::infinity() : 0;
    }
    *value = minus ? -magnitude : magnitude;
    return true;
}

std::string Float32Text(float value) {
    char text[64];  // the longest has a sign, 39 digits, a point and 6 digits
    auto end = std::to_chars(text, text + sizeof text, static_cast<double>(value), std::chars_format::fixed, 6).ptr;
    return std::string(text, end);
}

}  // namespace tessel

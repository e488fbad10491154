// Renders the items of a formatting call.
#ifndef TESSEL_STRINGS_FMTRENDERER_H
#define TESSEL_STRINGS_FMTRENDERER_H

#include "strings/FmtItem.h"
#include "strings/FmtOutput.h"
#include "strings/LStrView.h"
#include <tessel/base/StringTypes.h>

namespace tessel {

class FmtRenderer {
public:
    explicit FmtRenderer(FmtOutput& output) : output_(output) {}

    void SetDecimalPoint(uint8 decimalPoint) { decimalPoint_ = decimalPoint; }

    void Render(FmtItem item, const FmtSpec& spec, FmtValue value) {
        if (item == FmtItem::kSigned && spec.type == kFmtNoType) {
            RenderDecimal(spec, Magnitude(value.integer), value.integer < 0);
        } else if (item == FmtItem::kCString) {
            RenderCString(spec, static_cast<CStr>(value.pointer));
        } else {
            RenderOther(item, spec, value);
        }
    }

private:
    void RenderDecimal(const FmtSpec& spec, uint64 magnitude, bool negative) {
        const size_t length = CountDecimalDigits(magnitude) + negative;
        const size_t pad = Padding(spec, length);
        if (pad == 0) return output_.PutDecimal(magnitude, negative);
        char* place = output_.Take(pad + length);
        if (!place) return RenderDecimalInPieces(spec, magnitude, negative);
        const bool signFirst = negative && spec.pad == '0' && !spec.left;
        char* number = spec.left ? place : place + pad;
        FillFew(spec.left ? place + length : place + signFirst, spec.left ? ' ' : spec.pad, pad);
        WriteDecimalDigits(number + length, magnitude);
        if (negative) *(signFirst ? place : number) = '-';
    }

    void RenderCString(const FmtSpec& spec, CStr text) {
        size_t length = 0;
        if (text && spec.precision < 0) {
            length = std::strlen(text);
        } else if (text) {
            const void* end = std::memchr(text, 0, static_cast<size_t>(spec.precision));
            length = end ? static_cast<size_t>(static_cast<CStr>(end) - text) : static_cast<size_t>(spec.precision);
        }
        PutPadded(spec, text, length);
    }

    void PutPadded(const FmtSpec& spec, const char* text, size_t length) {
        const size_t pad = Padding(spec, length);
        if (pad != 0 && !spec.left) output_.Fill(spec.pad, pad);
        output_.Put(text, length);
        if (pad != 0 && spec.left) output_.Fill(' ', pad);
    }

    static size_t Padding(const FmtSpec& spec, size_t length) {
        const auto width = static_cast<size_t>(spec.width);
        return width > length ? width - length : 0;
    }

    void RenderOther(FmtItem item, const FmtSpec& spec, FmtValue value);
    void RenderNumber(FmtItem item, const FmtSpec& spec, FmtValue value);
    void RenderDecimalInPieces(const FmtSpec& spec, uint64 magnitude, bool negative);
    void RenderInteger(FmtItem item, const FmtSpec& spec, int64 value);
    void RenderReal(FmtItem item, const FmtSpec& spec, double value);
    void RenderTyped(FmtItem item, const FmtSpec& spec, const void* value, int16 type);
    void RenderCharacter(const FmtSpec& spec, int32 value);
    void RenderText(const FmtSpec& spec, LStrView text);
    void RenderPath(Path path);
    void RenderPoint(uint32 point);
    void RenderRectangle(const int16* rectangle);
    void PutNumber(const FmtSpec& spec, const char* text, size_t length);
    void PutWord(const char* word) {
        while (*word) output_.Put(*word++);
    }
    void PutShort(int16 value) { output_.PutDecimal(Magnitude(value), value < 0); }

    FmtOutput& output_;
    uint8 decimalPoint_ = '.';
};

}  // namespace tessel

#endif

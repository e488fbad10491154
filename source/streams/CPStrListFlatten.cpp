// The members of CPStrList that need the streams.
#include "strings/CPStrWalk.h"
#include "strings/HandleOps.h"
#include <tessel/streams/BinDataReader.h>
#include <tessel/streams/BinDataWriter.h>
#include <tessel/strings/CPStrList.h>
#include <tessel/strings/StringCPStr.h>

#include <cstring>

namespace tessel {
namespace {

constexpr uint32 kNoPadding = 1;

}  // namespace

MgErr CPStrList::Flatten(BinDataWriter& writer) const {
    const int32 count = Count();
    writer.WriteI32(count);
    ConstPStr element = count != 0 ? (*list_)->bytes : nullptr;
    for (int32 i = 0; i < count; ++i, element += element[0] + 1) writer.WritePStr(element, kNoPadding);
    return writer.GetError();
}

MgErr CPStrList::UnFlatten(BinDataReader& reader) {
    if (MgErr err = ForceAllocate()) return err;
    if (MgErr err = Clear()) return err;
    const int32 count = reader.ReadI32();
    uint32 size = CPStrSize(*list_);
    for (int32 i = 0; i < count; ++i) {
        Str255 element;
        reader.ReadPStr(element, kNoPadding);
        if (reader.GetError()) break;
        const uint32 added = element[0] + 1u;
        if (MgErr err = DSSetHandleSize(AsHandle(list_), size + added)) return err;
        std::memcpy(*AsHandle(list_) + size, element, added);
        size += added;
        ++(*list_)->count;
    }
    return reader.GetError();
}

}  // namespace tessel

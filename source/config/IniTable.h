// How IniDocument finds records by hash.
#ifndef TESSEL_SOURCE_CONFIG_INITABLE_H
#define TESSEL_SOURCE_CONFIG_INITABLE_H

#include "config/IniDocument.h"

#include <algorithm>
#include <utility>

namespace tessel {

template <class Record>
template <class Matches>
IniDocument::Index IniDocument::Table<Record>::Find(const Records<Record>& records, std::uint32_t hash,
                                                    Matches matches) const {
    if (heads_.empty()) return kNone;
    Index at = heads_[hash & (heads_.size() - 1)];
    while (at != kNone && (records[at].hash != hash || !matches(records[at]))) at = records[at].sameBucket;
    return at;
}

template <class Record>
void IniDocument::Table<Record>::MakeRoom(Records<Record>& records, std::size_t count) {
    if (count <= heads_.size()) return;
    std::size_t size = 64;
    while (size < count) size *= 2;
    Records<Index> old(size, kNone);
    old.swap(heads_);
    for (Index next : old) {
        while (next != kNone) Insert(records, std::exchange(next, records[next].sameBucket));
    }
}

template <class Record>
void IniDocument::Table<Record>::Insert(Records<Record>& records, Index index) {
    Index& head = HeadOf(records[index].hash);
    records[index].sameBucket = head;
    head = index;
}

template <class Record>
void IniDocument::Table<Record>::Erase(Records<Record>& records, Index index) {
    Index* link = &HeadOf(records[index].hash);
    while (*link != index) link = &records[*link].sameBucket;
    *link = records[index].sameBucket;
}

}  // namespace tessel

#endif

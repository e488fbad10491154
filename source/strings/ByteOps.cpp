#include "strings/ByteOps.h"

#if defined(__x86_64__) || defined(__i386__)
#    include <immintrin.h>
#endif

namespace tessel {
namespace {

constexpr uint64 kEveryByte = 0x0101010101010101u;
constexpr uint64 kHighBits = 0x80 * kEveryByte;

/* The bits in which eight bytes differ, without the case of ASCII letters. */
uint64 AsciiDifference(uint64 x, uint64 y) {
    const uint64 lower = (x | 0x20 * kEveryByte) & ~kHighBits;
    const uint64 fromA = lower + (0x80 - 'a') * kEveryByte;
    const uint64 beyondZ = lower + (0x7F - 'z') * kEveryByte;
    const uint64 letters = (fromA ^ beyondZ) & kHighBits & ~x;
    return (x ^ y) & ~(letters >> 2);
}

#if defined(__x86_64__) || defined(__i386__)

constexpr size_t kBlock = sizeof(__m256i);

bool HasBlocks() {
    return __builtin_cpu_supports("avx2") != 0;
}

__attribute__((target("avx2"))) __m256i LoadBlock(const uint8* bytes) {
    return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(bytes));
}

/* How many bytes, in whole blocks, do not differ. */
__attribute__((target("avx2"))) size_t EqualBlocks(const uint8* a, const uint8* b, size_t n) {
    const __m256i caseBit = _mm256_set1_epi8(0x20);
    const __m256i firstLetter = _mm256_set1_epi8('a');
    const __m256i lastLetter = _mm256_set1_epi8('z' - 'a');
    size_t i = 0;
    for (; i + kBlock <= n; i += kBlock) {
        const __m256i x = LoadBlock(a + i);
        const __m256i fromA = _mm256_sub_epi8(_mm256_or_si256(x, caseBit), firstLetter);
        const __m256i letters = _mm256_cmpeq_epi8(_mm256_min_epu8(fromA, lastLetter), fromA);
        const __m256i difference = _mm256_xor_si256(x, LoadBlock(b + i));
        const __m256i ignored = _mm256_and_si256(letters, caseBit);
        if (!_mm256_testc_si256(ignored, difference)) break;
    }
    return i;
}

#else

constexpr size_t kBlock = SIZE_MAX;

bool HasBlocks() {
    return false;
}

size_t EqualBlocks(const uint8*, const uint8*, size_t) {
    return 0;
}

#endif

}  // namespace

size_t FirstAsciiDifference(const uint8* a, const uint8* b, size_t n) {
    const size_t equal = n >= kBlock && HasBlocks() ? EqualBlocks(a, b, n) : 0;
    return equal + FirstDifferenceBy(a + equal, b + equal, n - equal, AsciiDifference);
}

}  // namespace tessel

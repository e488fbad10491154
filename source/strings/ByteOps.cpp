// The wide steps of a comparison without case.
#include "strings/ByteOps.h"

#if defined(__x86_64__) || defined(__i386__)
#    include <immintrin.h>
#endif

namespace tessel {
namespace {

constexpr uint64 kEveryByte = 0x0101010101010101u;
constexpr uint64 kHighBits = 0x80 * kEveryByte;

// The bits in which eight bytes differ, without the case of ASCII letters.
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

// The bits in which two blocks differ, without the case of ASCII letters.
__attribute__((target("avx2"))) __m256i BlockDifference(const uint8* a, const uint8* b) {
    const __m256i caseBit = _mm256_set1_epi8(0x20);
    const __m256i toTheTop = _mm256_set1_epi8(0x7F - 'z');  // letters become the largest signed bytes
    const __m256i belowLetters = _mm256_set1_epi8(0x7F - 'z' + 'a' - 1);
    const __m256i x = LoadBlock(a);
    const __m256i letters = _mm256_cmpgt_epi8(_mm256_add_epi8(_mm256_or_si256(x, caseBit), toTheTop), belowLetters);
    return _mm256_andnot_si256(_mm256_and_si256(letters, caseBit), _mm256_xor_si256(x, LoadBlock(b)));
}

// How many bytes, in whole blocks, do not differ.
__attribute__((target("avx2"))) size_t EqualBlocks(const uint8* a, const uint8* b, size_t n) {
    size_t i = 0;
    for (; i + 4 * kBlock <= n; i += 4 * kBlock) {
        const __m256i first =
            _mm256_or_si256(BlockDifference(a + i, b + i), BlockDifference(a + i + kBlock, b + i + kBlock));
        const __m256i second = _mm256_or_si256(BlockDifference(a + i + 2 * kBlock, b + i + 2 * kBlock),
                                               BlockDifference(a + i + 3 * kBlock, b + i + 3 * kBlock));
        const __m256i all = _mm256_or_si256(first, second);
        if (!_mm256_testz_si256(all, all)) break;
    }
    for (; i + kBlock <= n; i += kBlock) {
        const __m256i difference = BlockDifference(a + i, b + i);
        if (!_mm256_testz_si256(difference, difference)) break;
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

// What the current instruction set can do.  Kernels ask these constants, and
// never for a target: a newer Highway has targets that this source does not know,
// and what fits one of them by its name would be wrong on the next.
//
// This folder is the only one that has intrinsics, .raw and conditions on
// targets, each in a function that has a portable form beside it.
//
// Included once per instruction set; the usual guards do not apply.

#if defined(QUILLON_SIMD_TARGET_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef QUILLON_SIMD_TARGET_INL_H
#undef QUILLON_SIMD_TARGET_INL_H
#else
#define QUILLON_SIMD_TARGET_INL_H
#endif

#include "hwy/highway.h"

#include <cstddef>
#include <cstdint>

// Whether there are vectors.  Without, a kernel file has plain loops in their
// place: it asks once, for its whole body.
#undef QUILLON_HAS_VECTORS
#if HWY_TARGET == HWY_SCALAR || HWY_TARGET == HWY_EMU128
#define QUILLON_HAS_VECTORS 0
#else
#define QUILLON_HAS_VECTORS 1
#endif

#if QUILLON_HAS_VECTORS && HWY_HAVE_SCALABLE
#error "The size of a vector has to be known when a kernel is compiled"
#endif

// Intrinsics to write for, inside this folder only.  Better targets have lower
// values, and a family's are next to each other.
#undef QUILLON_X86_SSSE3
#undef QUILLON_X86_AVX2
#undef QUILLON_X86_AVX512
#define QUILLON_X86_SSSE3 (HWY_ARCH_X86 && HWY_TARGET <= HWY_SSSE3)
#define QUILLON_X86_AVX2 (QUILLON_X86_SSSE3 && HWY_CAP_GE256)
#define QUILLON_X86_AVX512 (QUILLON_X86_AVX2 && HWY_CAP_GE512)

#undef QUILLON_NEON
#define QUILLON_NEON (HWY_ARCH_ARM && HWY_TARGET == HWY_NEON)

HWY_BEFORE_NAMESPACE();
namespace quillon::HWY_NAMESPACE {
namespace hn = hwy::HWY_NAMESPACE;

// The widest tag of lanes T.
template <class T>
using Widest = hn::ScalableTag<T>;

template <class D>
inline constexpr size_t kLanes = hn::MaxLanes(D());

template <class D>
inline constexpr size_t kBytesOf = kLanes<D> * sizeof(hn::TFromD<D>);

// The bytes of the widest vector.
inline constexpr size_t kVectorBytes = kBytesOf<Widest<uint8_t>>;

// Loads and stores that leave out any lanes of 8 or 32 bits, and take no longer
// for it: the tail of a row is one vector then.
inline constexpr bool kHasMaskedTails = QUILLON_X86_AVX512;

// Stores that leave out lanes of so many bytes.
template <size_t kLaneBytes>
inline constexpr bool kHasMaskedStores = QUILLON_X86_AVX512 ||
                                         (QUILLON_X86_AVX2 && kLaneBytes == 4);

// Loads and stores that split pixels into vectors of one byte of each, and put these
// together again, in one instruction.
inline constexpr bool kHasInterleavedAccess = QUILLON_NEON;

// Products of bytes in lanes of twice the size, in one instruction for half a vector.
inline constexpr bool kHasWideningProducts = QUILLON_NEON;

// Bits of one vector in the place of those of another, by a third, in one instruction:
// hn::IfVecThenElse.
inline constexpr bool kHasBitInsertion = QUILLON_NEON;

// Stores of two vectors side by side in one instruction, which compilers make of two.
inline constexpr bool kHasPairedStores = QUILLON_NEON;

// Vectors that bodies with several rows load before they store one: across a store to
// another row compilers pair nothing.
inline constexpr size_t kVectorsAtOnce = kHasPairedStores ? 4 : 1;

// Registers of the processor that are not vectors.
inline constexpr size_t kGeneralRegisters = HWY_ARCH_X86 ? 16 : 32;

// The upper halves of 16-bit products, in one instruction.
inline constexpr bool kHasHighProducts = HWY_ARCH_X86;

// Products of unsigned by signed bytes, added in pairs, in one instruction.
inline constexpr bool kHasPairProducts = QUILLON_X86_SSSE3;

// Whether to prefetch: what the processor does not do of itself is measured on x86.
inline constexpr bool kPrefetchesAhead = HWY_ARCH_X86;

// Lookups in tables of 256 bytes or words that stay in vectors.
inline constexpr bool kHasTableLookup = QUILLON_X86_AVX512 || QUILLON_NEON;

// Whether a gather is faster than to load its lanes one by one.
inline constexpr bool kHasFastGather = QUILLON_X86_AVX512;

} // namespace quillon::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif

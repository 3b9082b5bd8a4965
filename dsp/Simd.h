#pragma once

#include <cstdint>
#include <cstring>

// Four-lane single-precision (and two-lane double-precision) vectors for the engine's inner
// loops, on the GCC/Clang vector extensions: every lane performs exactly the IEEE operation the
// scalar code performs, so vector and scalar paths give identical results.

#if ! (defined (__GNUC__) || defined (__clang__))
 #error "veltrane_dsp needs the GCC/Clang vector extensions"
#endif

namespace veltrane::simd
{

using Float4 = float __attribute__ ((vector_size (16)));
using Int4 = int32_t __attribute__ ((vector_size (16)));
using Double2 = double __attribute__ ((vector_size (16)));
using Long2 = int64_t __attribute__ ((vector_size (16)));
using Float2 = float __attribute__ ((vector_size (8)));

inline Float4 splat (float x) noexcept { return Float4 { x, x, x, x }; }
inline Double2 splat (double x) noexcept { return Double2 { x, x }; }

inline Float4 load (const float* p) noexcept
{
    Float4 v;
    std::memcpy (&v, p, sizeof v);
    return v;
}

inline void store (float* p, Float4 v) noexcept { std::memcpy (p, &v, sizeof v); }

// Lanes of a where mask is set (all bits), else lanes of b.
// Kept in the floating-point domain on x86 (andps rather than pand), which spares the
// bypass delay between integer and floating-point units on the envelopes' feedback chain.
inline Float4 select (Int4 mask, Float4 a, Float4 b) noexcept
{
#if defined (__SSE2__)
    const auto m = (Float4) mask;
    return __builtin_ia32_orps (__builtin_ia32_andps (m, a), __builtin_ia32_andnps (m, b));
#else
    return (Float4) (((Int4) a & mask) | ((Int4) b & ~mask));
#endif
}

inline Double2 select (Long2 mask, Double2 a, Double2 b) noexcept
{
#if defined (__SSE2__)
    const auto m = (Double2) mask;
    return __builtin_ia32_orpd (__builtin_ia32_andpd (m, a), __builtin_ia32_andnpd (m, b));
#else
    return (Double2) (((Long2) a & mask) | ((Long2) b & ~mask));
#endif
}
inline Int4 select (Int4 mask, Int4 a, Int4 b) noexcept { return (a & mask) | (b & ~mask); }
inline float select (bool condition, float a, float b) noexcept { return condition ? a : b; }

inline float abs (float v) noexcept { return __builtin_fabsf (v); }
inline Float4 abs (Float4 v) noexcept
{
#if defined (__SSE2__)
    return __builtin_ia32_andps (v, (Float4) Int4 { 0x7fffffff, 0x7fffffff, 0x7fffffff, 0x7fffffff });
#else
    return (Float4) ((Int4) v & 0x7fffffff);
#endif
}

inline Double2 abs (Double2 v) noexcept { return (Double2) ((Long2) v & 0x7fffffffffffffffLL); }

// Correctly rounded in every lane, like std::sqrt.
inline Float4 sqrt (Float4 v) noexcept
{
#if defined (__SSE2__)
    return __builtin_ia32_sqrtps (v);
#else
    return Float4 { __builtin_sqrtf (v[0]), __builtin_sqrtf (v[1]), __builtin_sqrtf (v[2]), __builtin_sqrtf (v[3]) };
#endif
}

inline Int4 truncate (Float4 v) noexcept { return __builtin_convertvector (v, Int4); }
inline Float4 toFloat (Int4 v) noexcept { return __builtin_convertvector (v, Float4); }

inline Double2 lowToDouble (Float4 v) noexcept
{
#if defined (__SSE2__)
    return __builtin_ia32_cvtps2pd (v);
#else
    return __builtin_convertvector (__builtin_shufflevector (v, v, 0, 1), Double2);
#endif
}

inline Double2 highToDouble (Float4 v) noexcept { return lowToDouble (__builtin_shufflevector (v, v, 2, 3, 2, 3)); }

// Rounds both pairs to float: low to lanes 0 and 1, high to lanes 2 and 3.
inline Float4 toFloat (Double2 low, Double2 high) noexcept
{
#if defined (__SSE2__)
    return __builtin_shufflevector (__builtin_ia32_cvtpd2ps (low), __builtin_ia32_cvtpd2ps (high), 0, 1, 4, 5);
#else
    const auto l = __builtin_convertvector (low, Float2);
    const auto h = __builtin_convertvector (high, Float2);
    return __builtin_shufflevector (l, h, 0, 1, 2, 3);
#endif
}

inline bool allTrue (Int4 mask) noexcept
{
#if defined (__SSE2__)
    return __builtin_ia32_movmskps ((Float4) mask) == 0xf;
#else
    return (mask[0] & mask[1] & mask[2] & mask[3]) != 0;
#endif
}

} // namespace veltrane::simd

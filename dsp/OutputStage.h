#pragma once

#include "Simd.h"

#include <cmath>

namespace veltrane
{

// Indices of the "Waveshaper" choice list.
enum class Shaper { dry, softClipper, hardClipper, dirt };

// Index of the "MixMode" choice list.
enum class MixMode { parallel, chain, reverseChain, solo1, solo2, stereoParallel, reverseStereoParallel };

// The last stage of every output sample: the wet signal blended with the dry input, then
// shaped. There is no limiter after it. Single precision throughout.
struct OutputStage
{
    float balance = 1.0f;     // DryWet, 0 = dry only, 1 = wet only
    int shaper = 0;           // Shaper index
    float amount = 0.0f;      // WaveshaperAmount, the drive, 0..1

    // T is float, or simd::Float4 for four samples at once (the same operations lane by lane).
    template <typename T>
    T blend (T wet, T dry) const noexcept { return wet * balance + (1.0f - balance) * dry; }

    // "Soft Clipper" is a cubic, not a saturator: it peaks at sqrt(2) and folds over beyond sqrt(6).
    template <typename T>
    static T softClip (T v) noexcept { return v - v * v * v / 6.0f; }

    // "Hard Clipper": tanh with a drive of 1 (amount 0) to 10 (amount 1).
    static float hardClip (float v, float drive) noexcept { return std::tanh (drive * v); }

    static simd::Float4 hardClip (simd::Float4 v, float drive) noexcept
    {
        return simd::Float4 { hardClip (v[0], drive), hardClip (v[1], drive), hardClip (v[2], drive), hardClip (v[3], drive) };
    }
    static float hardClipDrive (float amount) noexcept { return 1.0f + 9.0f * amount; }

    // "Dirt": driven by 10 to 400, squashed into (-1, 1), bent by a sine and saturated; never
    // louder than tanh(sin(1)) = 0.686587.
    //
    // The sine and the tanh only ever see the narrow ranges |u| <= 1 and |s| < sin(1), where a
    // Taylor series and a continued-fraction approximant evaluated in double precision, each
    // rounded to float like the library function it stands for, are correctly rounded (glibc's
    // tanhf is within 2 ulp) at a fraction of the library's cost. Every sample goes through
    // this one four-lane version, so the result does not depend on how a block is split.
    static simd::Float4 dirt (simd::Float4 v, float drive) noexcept
    {
        using namespace simd;
        const auto t = v * drive;
        const auto u = t / sqrt (t * t + 1.0f);
        const auto s = toFloat (sinOfUnitRange (lowToDouble (u)), sinOfUnitRange (highToDouble (u)));
        return toFloat (tanhOfUnitRange (lowToDouble (s)), tanhOfUnitRange (highToDouble (s)));
    }

    static float dirt (float v, float drive) noexcept { return dirt (simd::splat (v), drive)[0]; }

    static float dirtDrive (float amount) noexcept { return 10.0f + 390.0f * amount; }

    // sin(x) for |x| <= 1: Taylor series to x^15 (truncation error below 3e-15), summed in
    // pairs (Estrin's scheme) to keep the chain of dependent operations short.
    static simd::Double2 sinOfUnitRange (simd::Double2 x) noexcept
    {
        const auto y = x * x;
        const auto y2 = y * y;
        const auto a0 = y * (-1.0 / 6.0) + 1.0;
        const auto a1 = y * (-1.0 / 5040.0) + 1.0 / 120.0;
        const auto a2 = y * (-1.0 / 39916800.0) + 1.0 / 362880.0;
        const auto a3 = y * (-1.0 / 1307674368000.0) + 1.0 / 6227020800.0;
        const auto b0 = a1 * y2 + a0;
        const auto b1 = a3 * y2 + a2;
        return x * (b1 * (y2 * y2) + b0);
    }

    // tanh(x) for |x| <= 0.85: Lambert's continued fraction cut after 13, as x P(x^2) / Q(x^2)
    // (relative error below 3e-13).
    static simd::Double2 tanhOfUnitRange (simd::Double2 x) noexcept
    {
        const auto y = x * x;
        const auto y2 = y * y;
        const auto p = (y + 378.0) * y2 + (y * 17325.0 + 135135.0);
        const auto q = (y * 28.0 + 3150.0) * y2 + (y * 62370.0 + 135135.0);
        return x * p / q;
    }

    float shape (float v) const noexcept
    {
        switch ((Shaper) shaper)
        {
            case Shaper::softClipper: return softClip (v);
            case Shaper::hardClipper: return hardClip (v, hardClipDrive (amount));
            case Shaper::dirt:        return dirt (v, dirtDrive (amount));
            case Shaper::dry:
            default:                  return v;
        }
    }
};

} // namespace veltrane

#pragma once

#include <cmath>

namespace veltrane
{

// Indices of the "Waveshaper" choice list.
enum class Shaper { dry, softClipper, hardClipper, dirt };

// Index of the "MixMode" choice list.
enum class MixMode { parallel, chain, reverseChain, solo1, solo2, stereoParallel, reverseStereoParallel };

// Amplitude factor of a level in dB; -100 dB or less is silence.
inline float decibelsToGain (float dB) noexcept
{
    return dB > -100.0f ? std::pow (10.0f, dB * 0.05f) : 0.0f;
}

// The last stage of every output sample: the wet signal blended with the dry input, then
// shaped. There is no limiter after it. Single precision throughout.
struct OutputStage
{
    float balance = 1.0f;     // DryWet, 0 = dry only, 1 = wet only
    int shaper = 0;           // Shaper index
    float amount = 0.0f;      // WaveshaperAmount, the drive, 0..1

    float blend (float wet, float dry) const noexcept { return wet * balance + (1.0f - balance) * dry; }

    // "Soft Clipper" is a cubic, not a saturator: it peaks at sqrt(2) and folds over beyond sqrt(6).
    static float softClip (float v) noexcept { return v - v * v * v / 6.0f; }

    // "Hard Clipper": tanh with a drive of 1 (amount 0) to 10 (amount 1).
    static float hardClip (float v, float drive) noexcept { return std::tanh (drive * v); }
    static float hardClipDrive (float amount) noexcept { return 1.0f + 9.0f * amount; }

    // "Dirt": driven by 10 to 400, squashed into (-1, 1), bent by a sine and saturated; never
    // louder than tanh(sin(1)) = 0.686587.
    static float dirt (float v, float drive) noexcept
    {
        const auto t = drive * v;
        return std::tanh (std::sin (t / std::sqrt (t * t + 1.0f)));
    }
    static float dirtDrive (float amount) noexcept { return 10.0f + 390.0f * amount; }

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

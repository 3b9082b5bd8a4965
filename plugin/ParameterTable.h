#pragma once

#include <array>
#include <cstddef>

namespace veltrane
{

// Index of each parameter: the number it has for the host, the engine, MIDI learn,
// presets and the editor. Row order of parameterTable below follows this enum.
namespace Param
{
    enum Index : int
    {
        Delay1Time, Delay1Feedback, Delay1TimeMod, Delay1TimeModSource,
        Delay1FeedbackMod, Delay1FeedbackModSource, Delay1Gain,
        Delay2Time, Delay2Feedback, Delay2TimeMod, Delay2TimeModSource,
        Delay2FeedbackMod, Delay2FeedbackModSource, Delay2Gain,
        MixMode, DryWet, Waveshaper, WaveshaperAmount, Randomize,
        Envelope1Sensitivity, Envelope1Attack, Envelope1Release,
        Envelope2Sensitivity, Envelope2Attack, Envelope2Release,
        LFO1Wave, LFO1Rate, LFO1Sync, LFO1SyncedRate,
        LFO2Wave, LFO2Rate, LFO2Sync, LFO2SyncedRate,
        count
    };
}

enum class Law { straight, square, root };

// A fixed list of display texts for a choice parameter (entry 0 first).
struct ChoiceList
{
    const char* const* entries = nullptr;
    int size = 0;
};

namespace Choices
{
    extern const ChoiceList modulationSources;
    extern const ChoiceList mixModes;
    extern const ChoiceList waveshaperTypes;
    extern const ChoiceList waves;
    extern const ChoiceList offOn;
    extern const ChoiceList syncDivisions;
}

// One row of the parameter table. Discrete parameters run from 0 to count - 1 with
// the straight law; their choice list gives the texts.
struct ParameterRow
{
    const char* identifier;
    const char* label;
    float minimum;
    float maximum;
    float defaultPhysical;
    Law law;
    const ChoiceList* choices;   // null for continuous parameters
};

extern const std::array<ParameterRow, Param::count> parameterTable;

// Parameters that Randomize leaves alone: both gains, the dry/wet balance, the
// waveshaper and its amount, Randomize itself and the two sync switches.
constexpr std::array<int, 8> randomizeSkipList { Param::Delay1Gain, Param::Delay2Gain, Param::DryWet,
                                                 Param::Waveshaper, Param::WaveshaperAmount, Param::Randomize,
                                                 Param::LFO1Sync, Param::LFO2Sync };

constexpr bool isRandomized (int index) noexcept
{
    for (auto skipped : randomizeSkipList)
        if (skipped == index)
            return false;
    return true;
}

// 10^(dB / 20) as the engine uses it: -100 dB or less is silence.
float decibelsToAmplitude (float decibels) noexcept;

} // namespace veltrane

#include "ParameterTable.h"

#include <cmath>

namespace veltrane
{

namespace
{
    const char* const modulationSourceTexts[] { "None", "Envelope 1", "Rev Envelope 1", "Envelope 2",
                                                "Rev Envelope 2", "LFO 1", "LFO 2" };
    const char* const mixModeTexts[] { "Parallel", "Chain", "Reverse Chain", "Solo 1", "Solo 2",
                                       "Stereo Parallel", "Reverse Stereo Parallel" };
    const char* const waveshaperTexts[] { "Dry", "Soft Clipper", "Hard Clipper", "Dirt" };
    const char* const waveTexts[] { "Sine", "Square", "Saw Up", "Saw Down", "Triangle", "Sample & Hold" };
    const char* const offOnTexts[] { "Off", "On" };
    const char* const syncDivisionTexts[] { "8 Bars", "4 Bars", "2 Bars", "1 Bar", "1/2", "1/2D", "1/4", "1/4D",
                                            "1/8", "1/8D", "1/16", "1/16D", "1/32", "1/32D", "1/64", "1/64D",
                                            "1/128", "1/128D" };

    template <std::size_t N>
    constexpr ChoiceList listOf (const char* const (&texts)[N]) { return { texts, (int) N }; }
}

namespace Choices
{
    const ChoiceList modulationSources = listOf (modulationSourceTexts);
    const ChoiceList mixModes          = listOf (mixModeTexts);
    const ChoiceList waveshaperTypes   = listOf (waveshaperTexts);
    const ChoiceList waves             = listOf (waveTexts);
    const ChoiceList offOn             = listOf (offOnTexts);
    const ChoiceList syncDivisions     = listOf (syncDivisionTexts);
}

using L = Law;

const std::array<ParameterRow, Param::count> parameterTable {{
    // identifier                 label  min    max     default law          choices
    { "Delay1Time",               "Ms",  1.0f,  2000.0f, 120.0f, L::square,   nullptr },
    { "Delay1Feedback",           "%",   0.0f,  100.0f,  40.0f,  L::straight, nullptr },
    { "Delay1TimeMod",            "%",   0.0f,  100.0f,  0.0f,   L::straight, nullptr },
    { "Delay1TimeModSource",      "",    0.0f,  6.0f,    0.0f,   L::straight, &Choices::modulationSources },
    { "Delay1FeedbackMod",        "%",   0.0f,  100.0f,  0.0f,   L::straight, nullptr },
    { "Delay1FeedbackModSource",  "",    0.0f,  6.0f,    0.0f,   L::straight, &Choices::modulationSources },
    { "Delay1Gain",               "dB", -70.0f, 6.0f,    0.0f,   L::root,     nullptr },
    { "Delay2Time",               "Ms",  1.0f,  2000.0f, 120.0f, L::square,   nullptr },
    { "Delay2Feedback",           "%",   0.0f,  100.0f,  40.0f,  L::straight, nullptr },
    { "Delay2TimeMod",            "%",   0.0f,  100.0f,  0.0f,   L::straight, nullptr },
    { "Delay2TimeModSource",      "",    0.0f,  6.0f,    0.0f,   L::straight, &Choices::modulationSources },
    { "Delay2FeedbackMod",        "%",   0.0f,  100.0f,  0.0f,   L::straight, nullptr },
    { "Delay2FeedbackModSource",  "",    0.0f,  6.0f,    0.0f,   L::straight, &Choices::modulationSources },
    { "Delay2Gain",               "dB", -70.0f, 6.0f,    0.0f,   L::root,     nullptr },
    { "MixMode",                  "",    0.0f,  6.0f,    0.0f,   L::straight, &Choices::mixModes },
    { "DryWet",                   "%",   0.0f,  100.0f,  100.0f, L::straight, nullptr },
    { "Waveshaper",               "",    0.0f,  3.0f,    0.0f,   L::straight, &Choices::waveshaperTypes },
    { "WaveshaperAmount",         "%",   0.0f,  100.0f,  0.0f,   L::straight, nullptr },
    { "Randomize",                "",    0.0f,  1.0f,    0.0f,   L::straight, &Choices::offOn },
    { "Envelope1Sensitivity",     "dB", -16.0f, 6.0f,    0.0f,   L::root,     nullptr },
    { "Envelope1Attack",          "Ms",  0.0f,  12.0f,   1.0f,   L::square,   nullptr },
    { "Envelope1Release",         "Ms",  0.0f,  12.0f,   2.0f,   L::square,   nullptr },
    { "Envelope2Sensitivity",     "dB", -16.0f, 6.0f,    0.0f,   L::root,     nullptr },
    { "Envelope2Attack",          "Ms",  0.0f,  12.0f,   1.0f,   L::square,   nullptr },
    { "Envelope2Release",         "Ms",  0.0f,  12.0f,   2.0f,   L::square,   nullptr },
    { "LFO1Wave",                 "",    0.0f,  5.0f,    0.0f,   L::straight, &Choices::waves },
    { "LFO1Rate",                 "Hz",  0.0f,  40.0f,   1.0f,   L::square,   nullptr },
    { "LFO1Sync",                 "",    0.0f,  1.0f,    0.0f,   L::straight, &Choices::offOn },
    { "LFO1SyncedRate",           "",    0.0f,  17.0f,   6.0f,   L::straight, &Choices::syncDivisions },
    { "LFO2Wave",                 "",    0.0f,  5.0f,    0.0f,   L::straight, &Choices::waves },
    { "LFO2Rate",                 "Hz",  0.0f,  40.0f,   1.0f,   L::square,   nullptr },
    { "LFO2Sync",                 "",    0.0f,  1.0f,    0.0f,   L::straight, &Choices::offOn },
    { "LFO2SyncedRate",           "",    0.0f,  17.0f,   6.0f,   L::straight, &Choices::syncDivisions },
}};

float decibelsToAmplitude (float decibels) noexcept
{
    return decibels <= -100.0f ? 0.0f : std::pow (10.0f, decibels * 0.05f);
}

} // namespace veltrane

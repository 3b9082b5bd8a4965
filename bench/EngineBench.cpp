// Engine throughput at 48 kHz in 512-sample blocks, reported as time per frame (one sample of
// every channel) and as a multiple of real time. Run by hand: build/bench/veltrane_bench.

#include "dsp/Engine.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstring>
#include <vector>

using namespace veltrane;

namespace
{
    constexpr double sampleRate = 48000.0;
    constexpr int blockSize = 512;

    EngineSettings dirtWithAllModulations()
    {
        EngineSettings s;
        s.delay[0] = { 350.0f, 0.6f, 0.4f, (int) ModSource::envelope1, 0.7f, (int) ModSource::lfo1, 1.0f };
        s.delay[1] = { 800.0f, 0.5f, 0.3f, (int) ModSource::lfo2, 0.5f, (int) ModSource::reverseEnvelope2, 0.8f };
        s.envelope[1] = { 1.5f, 3.0f, 8.0f };
        s.lfo[0] = { Lfo::triangle, 0.7f, false, 6 };
        s.lfo[1] = { Lfo::sine, 3.0f, true, 8 };
        s.shaper = (int) Shaper::dirt;
        s.shaperAmount = 0.4f;
        s.dryWet = 0.7f;
        return s;
    }

    void runEngine (benchmark::State& state, const EngineSettings& settings, int numChannels)
    {
        Engine engine (1234);
        engine.prepare (sampleRate);

        std::vector<float> source ((size_t) blockSize * 2);
        uint32_t noise = 1;

        for (auto& v : source)
        {
            noise = noise * 1664525u + 1013904223u;
            v = (float) (noise >> 8) / 16777216.0f - 0.5f;
        }

        std::vector<float> buffers[2] = { std::vector<float> (blockSize), std::vector<float> (blockSize) };
        float* channels[2] = { buffers[0].data(), buffers[1].data() };

        auto block = [&]
        {
            for (int c = 0; c < numChannels; ++c)
                std::memcpy (channels[c], source.data() + c * blockSize, sizeof (float) * blockSize);

            engine.beginBlock (settings, numChannels, blockSize);
            engine.process (channels, 0, blockSize);
            benchmark::DoNotOptimize (channels[0]);
            benchmark::DoNotOptimize (channels[1]);
        };

        for (int i = 0; i < 400; ++i) // let both delay times settle first
            block();

        for (auto _ : state)
            block();

        // Time per frame (seconds, printed with an SI prefix: 8.5n is 8.5 ns) and seconds of
        // audio per second of processing (the multiple of real time).
        const auto frames = (double) state.iterations() * blockSize;
        state.counters["per_frame"] = benchmark::Counter (frames, benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
        state.counters["x_realtime"] = benchmark::Counter (frames / sampleRate, benchmark::Counter::kIsRate);
    }

    void defaults (benchmark::State& state) { runEngine (state, EngineSettings {}, 2); }

    void dirtWithModulations (benchmark::State& state) { runEngine (state, dirtWithAllModulations(), 2); }

    void chain (benchmark::State& state)
    {
        EngineSettings s;
        s.mixMode = (int) MixMode::chain;
        s.delay[1].timeMs = 300.0f;
        runEngine (state, s, 2);
    }

    void mono (benchmark::State& state) { runEngine (state, EngineSettings {}, 1); }
}

BENCHMARK (defaults);
BENCHMARK (dirtWithModulations);
BENCHMARK (chain);
BENCHMARK (mono);

BENCHMARK_MAIN();

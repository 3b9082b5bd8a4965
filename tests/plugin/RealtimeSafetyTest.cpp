// The audio thread's promise: once running, a block with no request pending (no preset load,
// no clear of bindings, no Randomize, no learned controller) allocates nothing and takes no
// lock. This binary replaces the C allocation functions (which operator new, juce::HeapBlock
// and every container end in) and the pthread mutex and rwlock entry points (which
// std::mutex and juce::CriticalSection end in) with versions that count calls made by the
// armed thread while it runs processBlock. Spin locks built on atomics are not seen; none
// exists in the plug-in. Sanitizer builds replace the same functions, so there the test
// skips itself.

#include "plugin/VeltraneAudioProcessor.h"

#include <gtest/gtest.h>

#include <cstddef>
#include <dlfcn.h>
#include <mutex>
#include <pthread.h>
#include <vector>

#if defined (__SANITIZE_ADDRESS__) || defined (__SANITIZE_THREAD__)
 #define VELTRANE_COUNTING 0
#elif defined (__has_feature)
 #if __has_feature (address_sanitizer) || __has_feature (thread_sanitizer)
  #define VELTRANE_COUNTING 0
 #endif
#endif

#ifndef VELTRANE_COUNTING
 #define VELTRANE_COUNTING 1
#endif

namespace
{
    thread_local bool armed = false;
    thread_local int allocations = 0;
    thread_local int locks = 0;

    void countAllocation() noexcept
    {
        if (armed)
            ++allocations;
    }

    void countLock() noexcept
    {
        if (armed)
            ++locks;
    }

    struct Counting
    {
        Counting() { allocations = locks = 0; armed = true; }
        ~Counting() { armed = false; }
    };
}

#if VELTRANE_COUNTING
extern "C"
{
    void* __libc_malloc (size_t);
    void* __libc_calloc (size_t, size_t);
    void* __libc_realloc (void*, size_t);
    void* __libc_memalign (size_t, size_t);
    void __libc_free (void*);

    void* malloc (size_t size) { countAllocation(); return __libc_malloc (size); }
    void* calloc (size_t count, size_t size) { countAllocation(); return __libc_calloc (count, size); }
    void* realloc (void* p, size_t size) { countAllocation(); return __libc_realloc (p, size); }
    void* aligned_alloc (size_t alignment, size_t size) { countAllocation(); return __libc_memalign (alignment, size); }
    void* memalign (size_t alignment, size_t size) { countAllocation(); return __libc_memalign (alignment, size); }
    void free (void* p) { __libc_free (p); }

    int posix_memalign (void** result, size_t alignment, size_t size)
    {
        countAllocation();
        *result = __libc_memalign (alignment, size);
        return *result != nullptr ? 0 : 12; // ENOMEM
    }
}

namespace
{
    template <typename Function>
    Function next (const char* name) { return reinterpret_cast<Function> (dlsym (RTLD_NEXT, name)); }

    using MutexCall = int (*) (pthread_mutex_t*);
    using RwLockCall = int (*) (pthread_rwlock_t*);
    const auto realMutexLock = next<MutexCall> ("pthread_mutex_lock");
    const auto realMutexTryLock = next<MutexCall> ("pthread_mutex_trylock");
    const auto realReadLock = next<RwLockCall> ("pthread_rwlock_rdlock");
    const auto realWriteLock = next<RwLockCall> ("pthread_rwlock_wrlock");
}

extern "C"
{
    int pthread_mutex_lock (pthread_mutex_t* m) { countLock(); return realMutexLock (m); }
    int pthread_mutex_trylock (pthread_mutex_t* m) { countLock(); return realMutexTryLock (m); }
    int pthread_rwlock_rdlock (pthread_rwlock_t* l) { countLock(); return realReadLock (l); }
    int pthread_rwlock_wrlock (pthread_rwlock_t* l) { countLock(); return realWriteLock (l); }
}
#endif

using namespace veltrane;

namespace
{
    struct PlayHead final : juce::AudioPlayHead
    {
        PlayHead() { position.setBpm (128.0); position.setIsPlaying (true); }
        juce::Optional<PositionInfo> getPosition() const override { return position; }
        PositionInfo position;
    };
}

TEST (RealtimeSafety, CountersSeeAllocationsAndLocks)
{
    if (! VELTRANE_COUNTING)
        GTEST_SKIP() << "sanitizer build";

    std::mutex mutex;
    int seenAllocations = 0, seenLocks = 0;

    {
        Counting counting;
        auto* block = new std::vector<float> (1000);
        mutex.lock();
        mutex.unlock();
        delete block;
        seenAllocations = allocations;
        seenLocks = locks;
    }

    EXPECT_GE (seenAllocations, 2);
    EXPECT_GE (seenLocks, 1);
}

TEST (RealtimeSafety, BlocksAllocateNothingAndTakeNoLockInEveryMixModeAndShaper)
{
    if (! VELTRANE_COUNTING)
        GTEST_SKIP() << "sanitizer build";

    PlayHead playHead;

    for (int mode = 0; mode < 7; ++mode)
    {
        for (int shaper = 0; shaper < 4; ++shaper)
        {
            VeltraneAudioProcessor processor;
            processor.setPlayHead (&playHead);
            processor.prepareToPlay (48000.0, 512);

            // Every kind of source in use, a synced "Sample & Hold" LFO, gliding times.
            const std::pair<int, float> settings[] = {
                { Param::MixMode, (float) mode / 6.0f }, { Param::Waveshaper, (float) shaper / 3.0f },
                { Param::WaveshaperAmount, 0.6f }, { Param::DryWet, 0.7f },
                { Param::Delay1TimeModSource, 1.0f / 6.0f }, { Param::Delay1TimeMod, 0.5f },
                { Param::Delay1FeedbackModSource, 5.0f / 6.0f }, { Param::Delay1FeedbackMod, 0.8f },
                { Param::Delay2TimeModSource, 1.0f }, { Param::Delay2TimeMod, 0.3f },
                { Param::Delay2FeedbackModSource, 4.0f / 6.0f }, { Param::Delay2FeedbackMod, 1.0f },
                { Param::LFO2Wave, 1.0f }, { Param::LFO2Sync, 1.0f }, { Param::LFO1Rate, 0.5f },
                { Param::Delay1Time, 0.6f }, { Param::Delay2Time, 0.1f },
            };

            for (auto [index, value] : settings)
                processor.setParameter (index, value);

            // Notes restart the LFOs; an unlearned controller and note-offs do nothing.
            juce::MidiBuffer midi;
            midi.addEvent (juce::MidiMessage::noteOn (1, 60, (juce::uint8) 100), 17);
            midi.addEvent (juce::MidiMessage::controllerEvent (1, 74, 64), 90);
            midi.addEvent (juce::MidiMessage::noteOff (1, 60), 200);
            midi.addEvent (juce::MidiMessage::noteOn (2, 64, (juce::uint8) 80), 301);

            juce::AudioBuffer<float> buffer (2, 512);
            int seenAllocations = 0, seenLocks = 0;

            for (int block = 0; block < 12; ++block)
            {
                for (int i = 0; i < buffer.getNumSamples(); ++i)
                    for (int c = 0; c < 2; ++c)
                        buffer.setSample (c, i, (i % 97) == 0 ? 0.8f : 0.01f * (float) ((i * (c + 3)) % 13));

                if (block < 2) // the first blocks may settle things; the steady state is checked
                {
                    processor.processBlock (buffer, midi);
                    continue;
                }

                Counting counting;
                processor.processBlock (buffer, midi);
                seenAllocations += allocations;
                seenLocks += locks;
            }

            EXPECT_EQ (seenAllocations, 0) << "mix mode " << mode << ", shaper " << shaper;
            EXPECT_EQ (seenLocks, 0) << "mix mode " << mode << ", shaper " << shaper;
        }
    }
}

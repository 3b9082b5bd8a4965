// Once running, a block with no request pending allocates nothing and takes no lock. This binary
// counts the armed thread's calls of the C allocation functions and pthread's locks (where new,
// std::mutex and juce::CriticalSection end); sanitizer builds replace the same, so it stays out of them.

#include "plugin/VeltraneAudioProcessor.h"

#include <gtest/gtest.h>

#include <dlfcn.h>
#include <mutex>
#include <pthread.h>

namespace
{
thread_local bool armed = false;
thread_local int calls = 0;   // allocations and locks while armed
void count() noexcept { calls += armed ? 1 : 0; }

template <typename Function>
Function next (const char* name) { return reinterpret_cast<Function> (dlsym (RTLD_NEXT, name)); }
const auto realMutexLock = next<int (*) (pthread_mutex_t*)> ("pthread_mutex_lock");
const auto realMutexTryLock = next<int (*) (pthread_mutex_t*)> ("pthread_mutex_trylock");
const auto realReadLock = next<int (*) (pthread_rwlock_t*)> ("pthread_rwlock_rdlock");
const auto realWriteLock = next<int (*) (pthread_rwlock_t*)> ("pthread_rwlock_wrlock");

template <typename Fn>
int callsDuring (Fn&& fn) { calls = 0, armed = true; fn(); armed = false; return calls; }
}

extern "C"
{
void* __libc_malloc (size_t);
void* __libc_calloc (size_t, size_t);
void* __libc_realloc (void*, size_t);
void* __libc_memalign (size_t, size_t);
void* malloc (size_t size) { count(); return __libc_malloc (size); }
void* calloc (size_t n, size_t size) { count(); return __libc_calloc (n, size); }
void* realloc (void* p, size_t size) { count(); return __libc_realloc (p, size); }
void* aligned_alloc (size_t alignment, size_t size) { count(); return __libc_memalign (alignment, size); }
void* memalign (size_t alignment, size_t size) { count(); return __libc_memalign (alignment, size); }
int posix_memalign (void** p, size_t alignment, size_t size) { count(); *p = __libc_memalign (alignment, size); return *p != nullptr ? 0 : 12; }
int pthread_mutex_lock (pthread_mutex_t* m) { count(); return realMutexLock (m); }
int pthread_mutex_trylock (pthread_mutex_t* m) { count(); return realMutexTryLock (m); }
int pthread_rwlock_rdlock (pthread_rwlock_t* l) { count(); return realReadLock (l); }
int pthread_rwlock_wrlock (pthread_rwlock_t* l) { count(); return realWriteLock (l); }
}

TEST (RealtimeSafety, BlocksAllocateNothingAndTakeNoLockInEveryMixModeAndShaper)
{
    using namespace veltrane;
    std::mutex mutex;   // the counters see what they must
    EXPECT_GE (callsDuring ([&] { delete new std::vector<float> (10); std::lock_guard<std::mutex> lock (mutex); }), 2);

    struct PlayHead final : juce::AudioPlayHead { juce::Optional<PositionInfo> getPosition() const override { PositionInfo p; p.setBpm (128.0); return p; } } playHead;
    juce::MidiBuffer midi;   // notes restart the LFOs; an unlearned controller and a note-off do nothing
    for (auto [message, at] : { std::pair (juce::MidiMessage::noteOn (1, 60, (juce::uint8) 100), 17), { juce::MidiMessage::controllerEvent (1, 74, 64), 90 },
                                { juce::MidiMessage::noteOff (1, 60), 200 }, { juce::MidiMessage::noteOn (2, 64, (juce::uint8) 80), 301 } })
        midi.addEvent (message, at);

    for (int mode = 0; mode < 7 * 4; ++mode)
    {
        VeltraneAudioProcessor processor;
        processor.setPlayHead (&playHead);
        processor.prepareToPlay (48000.0, 512);
        // Every mix mode with every shaper, every kind of source, a synced "Sample & Hold" LFO, gliding times.
        for (auto [index, value] : { std::pair ((int) Param::MixMode, (float) (mode % 7) / 6.0f), { Param::Waveshaper, (float) (mode / 7) / 3.0f },
                                     { Param::DryWet, 0.7f }, { Param::Delay1TimeModSource, 1.0f / 6.0f }, { Param::Delay1TimeMod, 0.5f },
                                     { Param::Delay1FeedbackModSource, 5.0f / 6.0f }, { Param::Delay1FeedbackMod, 0.8f }, { Param::Delay2TimeModSource, 1.0f },
                                     { Param::Delay2TimeMod, 0.3f }, { Param::Delay2FeedbackModSource, 4.0f / 6.0f }, { Param::Delay2FeedbackMod, 1.0f },
                                     { Param::LFO2Wave, 1.0f }, { Param::LFO2Sync, 1.0f }, { Param::Delay1Time, 0.6f }, { Param::Delay2Time, 0.1f } })
            processor.setParameter (index, value);

        juce::AudioBuffer<float> buffer (2, 512);
        int seen = 0;
        for (int block = 0; block < 12; ++block)   // the first two blocks may settle things
        {
            for (int i = 0; i < 1024; ++i)
                buffer.setSample (i / 512, i % 512, (i % 97) == 0 ? 0.8f : 0.01f * (float) (i % 13));
            seen += callsDuring ([&] { processor.processBlock (buffer, midi); }) * (block < 2 ? 0 : 1);
        }
        EXPECT_EQ (seen, 0) << "mix mode " << mode % 7 << ", shaper " << mode / 7;
    }
}

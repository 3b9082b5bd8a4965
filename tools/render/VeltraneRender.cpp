// veltrane-render: loads the shipped VST2 binary the way a host does and renders a
// WAV file (or a built-in signal of short percussive hits) through it.

#include "RenderOptions.h"
#include "tools/common/PrivateHome.h"

#include <juce_audio_formats/juce_audio_formats.h>
#include <juce_audio_processors/juce_audio_processors.h>
#include <juce_gui_basics/juce_gui_basics.h>

#include <iostream>

namespace veltrane::render
{
namespace
{
struct Failure
{
    juce::String message;
};

// Four seconds of short decaying noise bursts, one hit a second: each echo
// stands out clearly between the hits.
juce::AudioBuffer<float> makeTestSignal (double sampleRate)
{
    const auto length = (int) (4.0 * sampleRate);
    juce::AudioBuffer<float> signal (2, length);
    signal.clear();
    juce::Random random (20261206);

    for (int hit = 0; hit < 4; ++hit)
    {
        const auto start = (int) (hit * sampleRate);
        const auto decaySamples = 0.004 * sampleRate;

        for (int j = 0; j < (int) (0.03 * sampleRate) && start + j < length; ++j)
        {
            const auto envelope = (float) std::exp (-j / decaySamples);
            signal.setSample (0, start + j, 0.8f * envelope * (random.nextFloat() * 2.0f - 1.0f));
            signal.setSample (1, start + j, 0.8f * envelope * (random.nextFloat() * 2.0f - 1.0f));
        }
    }

    return signal;
}

juce::AudioBuffer<float> readInput (const juce::File& file, double& fileRate)
{
    if (! file.existsAsFile())
        throw Failure { "input file not found: " + file.getFullPathName() };

    juce::AudioFormatManager formats;
    formats.registerBasicFormats();
    std::unique_ptr<juce::AudioFormatReader> reader (formats.createReaderFor (file));

    if (reader == nullptr)
        throw Failure { "cannot read audio from " + file.getFullPathName() };

    if (reader->numChannels < 1 || reader->numChannels > 2)
        throw Failure { "input must be mono or stereo: " + file.getFullPathName() };

    if (reader->lengthInSamples > std::numeric_limits<int>::max() / 2)
        throw Failure { "input is too long: " + file.getFullPathName() };

    juce::AudioBuffer<float> buffer ((int) reader->numChannels, (int) reader->lengthInSamples);
    reader->read (&buffer, 0, buffer.getNumSamples(), 0, true, true);
    fileRate = reader->sampleRate;
    return buffer;
}

// A transport that plays from the start at a steady tempo in 4/4; the render moves
// it on after every block.
class SteadyPlayHead final : public juce::AudioPlayHead
{
public:
    SteadyPlayHead (double bpm, double rate) : tempoBpm (bpm), sampleRate (rate) {}

    void advance (int samples) noexcept { position += samples; }

    juce::Optional<PositionInfo> getPosition() const override
    {
        const auto beats = (double) position / sampleRate * tempoBpm / 60.0;
        PositionInfo info;
        info.setBpm (tempoBpm);
        info.setTimeSignature (TimeSignature { 4, 4 });
        info.setIsPlaying (true);
        info.setTimeInSamples (position);
        info.setTimeInSeconds ((double) position / sampleRate);
        info.setPpqPosition (beats);
        info.setPpqPositionOfLastBarStart (4.0 * std::floor (beats / 4.0));
        info.setBarCount ((juce::int64) (beats / 4.0));
        return info;
    }

private:
    double tempoBpm, sampleRate;
    juce::int64 position = 0;
};

// A VST3 bundle (a folder ending in .vst3) or a VST2 binary.
std::unique_ptr<juce::AudioPluginInstance> loadPlugin (const juce::File& path, double sampleRate, int blockSize)
{
    const auto isVst3 = path.hasFileExtension ("vst3");

    if (! (isVst3 ? path.exists() : path.existsAsFile()))
        throw Failure { "plug-in not found: " + path.getFullPathName() };

    juce::VSTPluginFormat vst2;
    juce::VST3PluginFormat vst3;
    auto& format = isVst3 ? static_cast<juce::AudioPluginFormat&> (vst3) : vst2;
    juce::OwnedArray<juce::PluginDescription> descriptions;
    format.findAllTypesForFile (descriptions, path.getFullPathName());

    if (descriptions.isEmpty())
        throw Failure { juce::String ("not a loadable ") + (isVst3 ? "VST3" : "VST2") + " plug-in: " + path.getFullPathName() };

    juce::String error;
    auto instance = format.createInstanceFromDescription (*descriptions[0], sampleRate, blockSize, error);

    if (instance == nullptr)
        throw Failure { "cannot open the plug-in: " + error };

    return instance;
}

juce::AudioProcessorParameter* findParameter (juce::AudioPluginInstance& plugin, const juce::String& identifier)
{
    for (auto* parameter : plugin.getParameters())
        if (parameter->getName (64) == identifier)
            return parameter;

    return nullptr;
}

void applyPreset (juce::AudioPluginInstance& plugin, const juce::File& file)
{
    if (! file.existsAsFile())
        throw Failure { "preset file not found: " + file.getFullPathName() };

    const auto xml = juce::XmlDocument::parse (file);

    if (xml == nullptr || ! xml->hasTagName ("VELTRANE_PRESET"))
        throw Failure { "not a Veltrane preset: " + file.getFullPathName() };

    for (auto* parameter : plugin.getParameters())
    {
        const auto identifier = parameter->getName (64);

        if (xml->hasAttribute (identifier))
        {
            const auto value = (float) xml->getDoubleAttribute (identifier);

            if (value >= 0.0f && value <= 1.0f)
                parameter->setValueNotifyingHost (value);
        }
    }
}

void applyState (juce::AudioPluginInstance& plugin, const juce::File& file)
{
    juce::MemoryBlock chunk;

    if (! file.existsAsFile() || ! file.loadFileAsData (chunk))
        throw Failure { "cannot read state file: " + file.getFullPathName() };

    plugin.setStateInformation (chunk.getData(), (int) chunk.getSize());
}

void printInfo (juce::AudioPluginInstance& plugin)
{
    const auto description = plugin.getPluginDescription();
    std::cout << "name: " << plugin.getName() << "\n"
              << "vendor: " << description.manufacturerName << "\n"
              << "version: " << description.version << "\n"
              << "unique id: " << juce::String::toHexString (description.uniqueId) << "\n"
              << "file: " << description.fileOrIdentifier << "\n"
              << "inputs: " << plugin.getTotalNumInputChannels() << ", outputs: " << plugin.getTotalNumOutputChannels() << "\n"
              << "parameters: " << plugin.getParameters().size() << "\n";

    for (auto* parameter : plugin.getParameters())
        std::cout << "  " << parameter->getParameterIndex() << " " << parameter->getName (64)
                  << " = " << parameter->getValue() << " (" << parameter->getCurrentValueAsText() << ")\n";
}

void render (juce::AudioPluginInstance& plugin, juce::AudioBuffer<float>& audio, int blockSize, SteadyPlayHead& playHead)
{
    const auto channels = audio.getNumChannels();
    juce::AudioBuffer<float> block (juce::jmax (channels, plugin.getTotalNumOutputChannels()), blockSize);
    juce::MidiBuffer midi;

    for (int start = 0; start < audio.getNumSamples(); start += blockSize)
    {
        const auto length = juce::jmin (blockSize, audio.getNumSamples() - start);
        block.setSize (block.getNumChannels(), length, false, false, true);
        block.clear();

        for (int c = 0; c < channels; ++c)
            block.copyFrom (c, 0, audio, c, start, length);

        plugin.processBlock (block, midi);
        playHead.advance (length);
        midi.clear();

        for (int c = 0; c < channels; ++c)
            audio.copyFrom (c, start, block, c, 0, length);
    }
}

void writeWav (const juce::File& file, const juce::AudioBuffer<float>& audio, double sampleRate)
{
    // Written beside the target first, so a failed write never leaves a partial file
    // under the requested name.
    juce::TemporaryFile temporary (file);
    {
        std::unique_ptr<juce::OutputStream> stream (temporary.getFile().createOutputStream());

        if (stream == nullptr)
            throw Failure { "cannot write " + file.getFullPathName() };

        juce::WavAudioFormat wav;
        std::unique_ptr<juce::AudioFormatWriter> writer (
            wav.createWriterFor (stream.get(), sampleRate, (unsigned int) audio.getNumChannels(), 24, {}, 0));

        if (writer == nullptr)
            throw Failure { "cannot write a WAV file at " + juce::String (sampleRate) + " Hz" };

        stream.release();   // the writer owns it now

        if (! writer->writeFromAudioSampleBuffer (audio, 0, audio.getNumSamples()) || ! writer->flush())
            throw Failure { "cannot write " + file.getFullPathName() };
    }

    if (! temporary.overwriteTargetFileWithTemporary())
        throw Failure { "cannot write " + file.getFullPathName() };
}

void drawWaveform (juce::Graphics& g, const juce::AudioBuffer<float>& audio, juce::Rectangle<int> area,
                   juce::Colour colour, const juce::String& title)
{
    g.setColour (juce::Colour (0xff2b2b2b));
    g.fillRect (area);
    g.setColour (juce::Colour (0xff555555));
    g.drawHorizontalLine (area.getCentreY(), (float) area.getX(), (float) area.getRight());

    const auto channels = audio.getNumChannels();
    const auto laneHeight = area.getHeight() / juce::jmax (1, channels);

    for (int c = 0; c < channels; ++c)
    {
        const auto lane = area.withHeight (laneHeight).withY (area.getY() + c * laneHeight).reduced (0, 4);
        const auto* samples = audio.getReadPointer (c);
        const auto perPixel = juce::jmax (1, audio.getNumSamples() / area.getWidth());
        g.setColour (colour);

        for (int x = 0; x < area.getWidth(); ++x)
        {
            const auto first = x * perPixel;

            if (first >= audio.getNumSamples())
                break;

            const auto range = juce::FloatVectorOperations::findMinAndMax (samples + first,
                                                                          juce::jmin (perPixel, audio.getNumSamples() - first));
            const auto centre = (float) lane.getCentreY();
            const auto half = (float) lane.getHeight() * 0.5f;
            g.drawVerticalLine (area.getX() + x,
                                centre - juce::jlimit (-1.0f, 1.0f, range.getEnd()) * half,
                                centre - juce::jlimit (-1.0f, 1.0f, range.getStart()) * half + 1.0f);
        }
    }

    g.setColour (juce::Colours::white);
    g.setFont (14.0f);
    g.drawText (title, area.reduced (6, 4), juce::Justification::topLeft);
}

void writePlot (const juce::File& file, const juce::AudioBuffer<float>& input, const juce::AudioBuffer<float>& output,
                double sampleRate)
{
    juce::Image image (juce::Image::RGB, 1200, 500, true);
    {
        juce::Graphics g (image);
        g.fillAll (juce::Colour (0xff222222));
        const auto seconds = juce::String (output.getNumSamples() / sampleRate, 2) + " s";
        drawWaveform (g, input, { 10, 10, 1180, 235 }, juce::Colour (0xff9ab8d8), "input (" + seconds + ")");
        drawWaveform (g, output, { 10, 255, 1180, 235 }, juce::Colour (0xfff76029), "Veltrane output");
    }

    juce::TemporaryFile temporary (file);
    {
        juce::FileOutputStream stream (temporary.getFile());
        juce::PNGImageFormat png;

        if (! stream.openedOk() || ! png.writeImageToStream (image, stream))
            throw Failure { "cannot write " + file.getFullPathName() };
    }

    if (! temporary.overwriteTargetFileWithTemporary())
        throw Failure { "cannot write " + file.getFullPathName() };
}

int run (const RenderOptions& options)
{
    double inputRate = options.sampleRate;
    auto input = options.inputFile == juce::File() ? makeTestSignal (options.sampleRate)
                                                    : readInput (options.inputFile, inputRate);
    const auto sampleRate = options.inputFile == juce::File() ? options.sampleRate : inputRate;

    auto plugin = loadPlugin (options.pluginPath, sampleRate, options.blockSize);

    if (options.infoOnly)
    {
        printInfo (*plugin);
        return 0;
    }

    const auto channels = input.getNumChannels();

    if (channels == 1)
    {
        juce::AudioProcessor::BusesLayout mono;
        mono.inputBuses.add (juce::AudioChannelSet::mono());
        mono.outputBuses.add (juce::AudioChannelSet::mono());

        if (! plugin->setBusesLayout (mono))
            throw Failure { "the plug-in refused a mono layout" };
    }

    if (options.stateFile != juce::File())
        applyState (*plugin, options.stateFile);

    if (options.presetFile != juce::File())
        applyPreset (*plugin, options.presetFile);

    for (const auto& setting : options.parameters)
    {
        auto* parameter = findParameter (*plugin, setting.identifier);

        if (parameter == nullptr)
            throw Failure { "unknown parameter: " + setting.identifier };

        parameter->setValueNotifyingHost (setting.value);
    }

    plugin->prepareToPlay (sampleRate, options.blockSize);

    juce::AudioBuffer<float> audio (channels, input.getNumSamples() + (int) (options.tailSeconds * sampleRate));
    audio.clear();

    for (int c = 0; c < channels; ++c)
        audio.copyFrom (c, 0, input, c, 0, input.getNumSamples());

    auto inputPadded = audio;
    SteadyPlayHead playHead (options.tempoBpm, sampleRate);
    plugin->setPlayHead (&playHead);
    render (*plugin, audio, options.blockSize, playHead);
    plugin->setPlayHead (nullptr);
    plugin->releaseResources();

    double sumOfSquares = 0.0;
    float peak = 0.0f;
    bool finite = true;

    for (int c = 0; c < channels; ++c)
        for (int j = 0; j < audio.getNumSamples(); ++j)
        {
            const auto s = audio.getSample (c, j);
            finite = finite && std::isfinite (s);
            peak = juce::jmax (peak, std::abs (s));
            sumOfSquares += (double) s * s;
        }

    if (! finite)
        throw Failure { "the plug-in produced non-finite samples" };

    writeWav (options.outputFile, audio, sampleRate);

    if (options.plotFile != juce::File())
        writePlot (options.plotFile, inputPadded, audio, sampleRate);

    const auto rms = std::sqrt (sumOfSquares / juce::jmax (1, channels * audio.getNumSamples()));
    std::cout << options.outputFile.getFileName() << ": " << juce::String (audio.getNumSamples() / sampleRate, 3)
              << " s, " << channels << " ch, " << sampleRate << " Hz, peak "
              << juce::String (juce::Decibels::gainToDecibels (peak, -200.0f), 2) << " dBFS, rms "
              << juce::String (juce::Decibels::gainToDecibels ((float) rms, -200.0f), 2) << " dBFS" << std::endl;
    return 0;
}
}
} // namespace veltrane::render

int main (int argc, char* argv[])
{
    using namespace veltrane::render;
    const veltrane::tools::PrivateHome privateHome;
    const juce::ScopedJuceInitialiser_GUI juce;

    // JUCE's hosting logs each plug-in load; the tool's own output is its one line.
    struct SilentLogger final : juce::Logger { void logMessage (const juce::String&) override {} } silentLogger;
    juce::Logger::setCurrentLogger (&silentLogger);

    juce::StringArray args;
    for (int i = 1; i < argc; ++i)
        args.add (juce::CharPointer_UTF8 (argv[i]));

    juce::String error;
    const auto options = parseArguments (args, error);

    if (! options)
    {
        std::cerr << "veltrane-render: " << error << std::endl;
        return 2;
    }

    try
    {
        const auto result = run (*options);
        juce::Logger::setCurrentLogger (nullptr);
        return result;
    }
    catch (const Failure& failure)
    {
        std::cerr << "veltrane-render: " << failure.message << std::endl;
        juce::Logger::setCurrentLogger (nullptr);
        return 1;
    }
}

#include "RenderOptions.h"

namespace veltrane::render
{

juce::String usage()
{
    return "usage: veltrane-render [--info] [--input in.wav] [--output out.wav] [--plot picture.png]\n"
           "                       [--rate Hz] [--block samples] [--tail seconds] [--bpm tempo]\n"
           "                       [--preset file.vtp] [--state chunk.bin] [--plugin Veltrane.so|Veltrane.vst3]\n"
           "                       [Identifier=normalised ...]\n"
           "The plug-in plays along a transport running from the start in 4/4 at --bpm\n"
           "beats per minute (120 by default), which tempo-synced LFOs follow.\n";
}

juce::File defaultPluginPath()
{
    const auto installed = juce::File::getSpecialLocation (juce::File::hostApplicationPath)
                               .getParentDirectory().getSiblingFile ("lib/vst/Veltrane.so");
    return installed.existsAsFile() ? installed : juce::File (VELTRANE_DEFAULT_VST2_BINARY);
}

namespace
{
    bool parseNumber (const juce::String& text, double& result)
    {
        const auto trimmed = text.trim();

        if (trimmed.isEmpty() || ! trimmed.containsOnly ("0123456789.-+eE"))
            return false;

        result = trimmed.getDoubleValue();
        return std::isfinite (result);
    }
}

std::optional<RenderOptions> parseArguments (const juce::StringArray& args, juce::String& error)
{
    RenderOptions options;
    options.pluginPath = defaultPluginPath();
    options.outputFile = juce::File::getCurrentWorkingDirectory().getChildFile ("veltrane-render.wav");

    for (int i = 0; i < args.size(); ++i)
    {
        const auto& arg = args[i];

        auto nextValue = [&] (juce::String& value) {
            if (i + 1 >= args.size())
            {
                error = "missing value after " + arg;
                return false;
            }
            value = args[++i];
            return true;
        };

        auto fileValue = [&] (juce::File& file) {
            juce::String value;
            if (! nextValue (value))
                return false;
            file = juce::File::getCurrentWorkingDirectory().getChildFile (value);
            return true;
        };

        auto numberValue = [&] (double& number, double minimum, double maximum) {
            juce::String value;
            if (! nextValue (value))
                return false;
            if (! parseNumber (value, number) || number < minimum || number > maximum)
            {
                error = "bad value for " + arg + ": " + value;
                return false;
            }
            return true;
        };

        bool ok = true;
        double number = 0.0;

        if (arg == "--info")                      options.infoOnly = true;
        else if (arg == "--input")                ok = fileValue (options.inputFile);
        else if (arg == "--output")               ok = fileValue (options.outputFile);
        else if (arg == "--plot")                 ok = fileValue (options.plotFile);
        else if (arg == "--preset")               ok = fileValue (options.presetFile);
        else if (arg == "--state")                ok = fileValue (options.stateFile);
        else if (arg == "--plugin")               ok = fileValue (options.pluginPath);
        else if (arg == "--rate")                 { ok = numberValue (number, 8000.0, 384000.0); options.sampleRate = number; }
        else if (arg == "--block")                { ok = numberValue (number, 1.0, 65536.0); options.blockSize = (int) number; }
        else if (arg == "--tail")                 { ok = numberValue (number, 0.0, 600.0); options.tailSeconds = number; }
        else if (arg == "--bpm")                  { ok = numberValue (number, 1.0, 999.0); options.tempoBpm = number; }
        else if (arg == "--help" || arg == "-h")  { error = usage().trimEnd(); return std::nullopt; }
        else if (arg.containsChar ('=') && ! arg.startsWith ("-"))
        {
            ParameterSetting setting { arg.upToFirstOccurrenceOf ("=", false, false).trim(), 0.0f };
            double value = 0.0;

            if (! parseNumber (arg.fromFirstOccurrenceOf ("=", false, false), value) || value < 0.0 || value > 1.0)
            {
                error = "bad parameter value (expected a normalised value from 0 to 1): " + arg;
                return std::nullopt;
            }

            setting.value = (float) value;
            options.parameters.add (setting);
        }
        else
        {
            error = "unknown argument: " + arg;
            return std::nullopt;
        }

        if (! ok)
            return std::nullopt;
    }

    return options;
}

} // namespace veltrane::render

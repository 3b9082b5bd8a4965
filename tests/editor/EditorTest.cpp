// The editor as the user and the host drive it: layout, sizes, captions, every knob, switch and box.

#include "editor/VeltraneAudioProcessorEditor.h"
#include "plugin/VeltraneAudioProcessor.h"
#include "tools/common/PrivateHome.h"

#include <gtest/gtest.h>

#include <cmath>

using namespace veltrane;

namespace
{
// Calls fn on every component below root, depth first.
void visit (juce::Component& root, const std::function<void (juce::Component&)>& fn)
{
    for (auto* child : root.getChildren())
        fn (*child), visit (*child, fn);
}

// The first component of type T below root (depth first), with the given name unless empty.
template <typename T = juce::Component>
T& find (juce::Component& root, const juce::String& name = {})
{
    T* found = nullptr;
    visit (root, [&] (juce::Component& c) { if (auto* match = dynamic_cast<T*> (&c); found == nullptr && match != nullptr && (name.isEmpty() || c.getName() == name)) found = match; });
    return found != nullptr ? *found : throw std::runtime_error (("no component " + name).toStdString());
}

// One 50 ms poll of every panel, as the message loop runs it.
void tick (juce::Component& root)
{
    if (auto* timer = dynamic_cast<juce::Timer*> (&root))
        timer->timerCallback();
    for (auto* child : root.getChildren())
        tick (*child);
}

juce::MouseEvent mouseAt (juce::Component& c, juce::Point<float> pos, juce::Point<float> down, int clicks = 1)
{
    const auto now = juce::Time::getCurrentTime();
    return { juce::Desktop::getInstance().getMainMouseSource(), pos, {}, juce::MouseInputSource::defaultPressure, 0, 0, 0, 0, &c, &c, now, down, now, clicks, pos != down };
}

// A click as the mouse makes it: the listeners have heard it when this returns.
void click (juce::Component& button)
{
    const auto centre = button.getLocalBounds().getCentre().toFloat();
    button.mouseDown (mouseAt (button, centre, centre));
    button.mouseUp (mouseAt (button, centre, centre));
}

// A processor in a home of its own and its open editor, polled once.
struct OpenEditor
{
    explicit OpenEditor (float width = 1000.0f, float height = 500.0f)
    {
        processor.setLastEditorSize (width, height);
        editor = std::make_unique<VeltraneAudioProcessorEditor> (processor);
        tick (*editor);
    }
    template <typename T = juce::Component>
    T& in (const juce::String& panel, const juce::String& name) { return find<T> (find (*editor, panel), name); }
    const tools::PrivateHome home;
    VeltraneAudioProcessor processor;
    std::unique_ptr<VeltraneAudioProcessorEditor> editor;
};
// Every knob of the editor: its panel, its parameter and its choice steps (0: continuous).
const char *d1 = "Delay 1", *d2 = "Delay 2", *e1 = "Envelope1 Component", *e2 = "Envelope2 Component", *g = "Global Panel";
const struct Knob { const char* panel; const char* slider; int parameter; int steps; } knobs[] {
    { d1, "Time Slider", Param::Delay1Time, 0 }, { d1, "Feedback Slider", Param::Delay1Feedback, 0 }, { d1, "TimeMod Slider", Param::Delay1TimeMod, 0 },
    { d1, "FeedbackMod Slider", Param::Delay1FeedbackMod, 0 }, { d1, "TimeModSrc Slider", Param::Delay1TimeModSource, 6 },
    { d1, "FeedbackModSrc Slider", Param::Delay1FeedbackModSource, 6 }, { d1, "Gain Slider", Param::Delay1Gain, 0 },
    { d2, "Time Slider", Param::Delay2Time, 0 }, { d2, "TimeModSrc Slider", Param::Delay2TimeModSource, 6 }, { d2, "Gain Slider", Param::Delay2Gain, 0 },
    { e1, "Attack Slider", Param::Envelope1Attack, 0 }, { e1, "Release Slider", Param::Envelope1Release, 0 }, { e1, "Sensitivity Slider", Param::Envelope1Sensitivity, 0 },
    { e2, "Attack Slider", Param::Envelope2Attack, 0 },
    { "Lfo1 Component", "Wave Slider", Param::LFO1Wave, 5 }, { "Lfo1 Component", "Rate Slider", Param::LFO1Rate, 0 }, { "Lfo2 Component", "Rate Slider", Param::LFO2Rate, 0 },
    { "Lfo2 Component", "Synced Rate Slider", Param::LFO2SyncedRate, 17 }, { g, "Mix Mode Slider", Param::MixMode, 6 }, { g, "Dry Wet Slider", Param::DryWet, 0 },
    { g, "Waveshaper Slider", Param::Waveshaper, 3 }, { g, "Boost Slider", Param::WaveshaperAmount, 0 },
};
// The normalised default worked out from the table's physical default and law.
float tableDefault (int index)
{
    const auto& row = parameterTable[(size_t) index];
    const auto n = (row.defaultPhysical - row.minimum) / (row.maximum - row.minimum);
    return row.law == Law::square ? std::sqrt (n) : row.law == Law::root ? n * n : n;
}
// What the processor tells its listeners, as a host's wrapper hears it.
struct HostLog final : juce::AudioProcessorListener
{
    explicit HostLog (juce::AudioProcessor& p) : processor (p) { processor.addListener (this); }
    ~HostLog() override { processor.removeListener (this); }
    void audioProcessorParameterChanged (juce::AudioProcessor*, int i, float v) override { calls.add ("set " + juce::String (i) + " " + juce::String (v, 4)); }
    void audioProcessorChanged (juce::AudioProcessor*, const ChangeDetails&) override {}
    void audioProcessorParameterChangeGestureBegin (juce::AudioProcessor*, int i) override { calls.add ("begin " + juce::String (i)); }
    void audioProcessorParameterChangeGestureEnd (juce::AudioProcessor*, int i) override { calls.add ("end " + juce::String (i)); }
    juce::AudioProcessor& processor;
    juce::StringArray calls;
};
juce::String gesture (int index, double value) { return "begin " + juce::String (index) + "|set " + juce::String (index) + " " + juce::String (value, 4) + "|end " + juce::String (index); }
}

// Opened at the default size, then resized through zero (a damaged preferences file) to the smallest.
TEST (EditorLayout, ChildrenAndCaptionFontsFollowTheSizeEvenAfterAZeroSize)
{
    // Bottom to top: background, resize corner (unnamed), the panels in member order (MIDI unnamed).
    const struct { const char* name; juce::Rectangle<int> at1000, at800; } children[] {
        { "Veltrane Background", { 0, 0, 1000, 500 }, { 0, 0, 800, 400 } }, { "", { 980, 480, 20, 20 }, { 784, 384, 16, 16 } },
        { "Delay 1", { 0, 50, 400, 200 }, { 0, 40, 320, 160 } },             { "Delay 2", { 600, 50, 400, 200 }, { 480, 40, 320, 160 } },
        { "Envelope1 Component", { 0, 350, 200, 100 }, { 0, 280, 160, 80 } }, { "Envelope2 Component", { 200, 350, 200, 100 }, { 160, 280, 160, 80 } },
        { "Lfo1 Component", { 600, 350, 200, 100 }, { 480, 280, 160, 80 } }, { "Lfo2 Component", { 800, 350, 200, 100 }, { 640, 280, 160, 80 } },
        { "Global Panel", { 400, 50, 200, 450 }, { 320, 40, 160, 360 } },    { "", { 0, 460, 400, 30 }, { 0, 368, 320, 24 } },
        { "Preset Component", { 600, 250, 400, 100 }, { 480, 200, 320, 80 } },
    };
    OpenEditor open;
    ASSERT_EQ (open.editor->getNumChildComponents(), (int) std::size (children));
    for (const auto smallest : { false, true })
    {
        if (smallest)
            open.editor->setSize (0, 0), open.editor->setSize (800, 400);
        for (int i = 0; i < (int) std::size (children); ++i)
        {
            const auto* child = open.editor->getChildComponent (i);
            EXPECT_EQ (child->getName(), children[i].name) << i;
            EXPECT_EQ (child->getBounds(), smallest ? children[i].at800 : children[i].at1000) << children[i].name;
        }
        EXPECT_EQ (find<juce::TextButton> (*open.editor, "Learn button").getBounds().getHeight(), smallest ? 10 : 12);
        for (auto [panel, label, size] : { std::tuple ("Delay 2", "Time Label", 12.0f), { "Envelope1 Component", "Attack Label", 10.5f },
                                           { "Lfo2 Component", "Sync Label", 10.5f }, { "Global Panel", "Boost Label", 12.4f * 450.0f / 540.0f },
                                           { "Global Panel", "Last Parameter Name", 12.5f }, { "", "Clear Label", 9.0f } })
            EXPECT_NEAR (find<juce::Label> (*panel ? find (*open.editor, panel) : *open.editor, label).getFont().getHeight(), size * (smallest ? 0.8f : 1.0f), 1e-3f) << label;
    }
}

// A stored size is taken unless no window could have it; the corner keeps 2:1 and 800 to 2000 wide.
TEST (EditorLayout, StoredSizeCornerLimitsAndTheNextEditorOpensAtTheLastSize)
{
    const struct { float storedWidth, storedHeight; int width, height, dx, dy, draggedWidth, draggedHeight; } cases[] {
        { 1000.0f, 500.0f, 1000, 500, 200, 100, 1200, 600 }, { 1000.0f, 500.0f, 1000, 500, 300, 0, 1300, 650 },
        { 1234.9f, 617.7f, 1234, 617, 5000, 5000, 2000, 1000 }, { 3000.0f, 300.0f, 3000, 300, -500, -500, 800, 400 },
        { 0.0f, 0.0f, 1000, 500, 400, 200, 1400, 700 }, { -20.0f, 400.0f, 1000, 500, -500, -500, 800, 400 },
        { std::numeric_limits<float>::quiet_NaN(), 500.0f, 1000, 500, 200, 100, 1200, 600 }, { 1.0e12f, 5.0e11f, 1000, 500, 5000, 5000, 2000, 1000 } };
    for (const auto& c : cases)
    {
        OpenEditor open (c.storedWidth, c.storedHeight);
        EXPECT_EQ (open.editor->getBounds(), juce::Rectangle<int> (c.width, c.height)) << c.storedWidth;
        juce::Component& corner = find<juce::ResizableCornerComponent> (*open.editor);   // its mouse handlers are public there
        const juce::Point<float> start (5.0f, 5.0f), end (5.0f + (float) c.dx, 5.0f + (float) c.dy);
        corner.mouseDown (mouseAt (corner, start, start));
        corner.mouseDrag (mouseAt (corner, end, start));
        corner.mouseUp (mouseAt (corner, end, start));
        EXPECT_EQ (open.editor->getBounds(), juce::Rectangle<int> (c.draggedWidth, c.draggedHeight)) << c.storedWidth;
        open.editor.reset();
        EXPECT_EQ (VeltraneAudioProcessorEditor (open.processor).getBounds(), juce::Rectangle<int> (c.draggedWidth, c.draggedHeight)) << c.storedWidth;
    }
}

// Every text a label can show (names, choices, range ends, presets, captions) in every label.
TEST (CaptionFit, EveryTextShowsWholeAndOnlyTextsThatDoNotFitShrink)
{
    for (const auto size : { juce::Point<float> (1000.0f, 500.0f), juce::Point<float> (800.0f, 400.0f) })
    {
        OpenEditor open (size.x, size.y);
        juce::Array<juce::Label*> labels;
        visit (*open.editor, [&] (juce::Component& c) { if (auto* label = dynamic_cast<juce::Label*> (&c)) labels.add (label); });
        juce::StringArray texts (open.processor.getPresetNames());
        for (auto* label : labels)
            texts.add (label->getText());
        for (int i = 0; i < Param::count; ++i)
        {
            const auto* choices = parameterTable[(size_t) i].choices;
            const auto last = choices != nullptr ? choices->size - 1 : 1;
            texts.add (open.processor.getParameterName (i));
            for (int k = 0; k <= last; ++k)
            {
                open.processor.setParameter (i, (float) k / (float) last);
                texts.add (open.processor.getParameterText (i));
            }
        }
        ASSERT_GE (labels.size(), 40);   // the captions and the preset box's text

        auto& look = static_cast<juce::LookAndFeel_V2&> (open.editor->getLookAndFeel());
        for (auto* label : labels)
        {
            const auto design = label->getFont();
            const auto area = look.getLabelBorderSize (*label).subtractedFrom (label->getLocalBounds()).toFloat();
            for (const auto& text : texts)
            {
                label->setText (text, juce::dontSendNotification);
                const auto font = look.getLabelFont (*label);
                const auto width = font.getStringWidthFloat (text.trim());
                const auto where = label->getName() + " at " + juce::String (size.x) + ": " + text;
                EXPECT_LE (width, area.getWidth() + 0.01f) << where;   // whole: no ellipsis, not squashed either
                if (design.getStringWidthFloat (text.trim()) <= area.getWidth())
                    EXPECT_EQ (font.getHeight(), design.getHeight()) << where;
                else
                    EXPECT_GE (width, 0.99f * area.getWidth()) << where;   // no smaller than it must be
            }
        }
    }
}

// A drag moves a continuous knob by steps of 0.001; a double click gives the host the exact default.
TEST (ControlPanels, KnobsShowTheParameterSendOneGesturePerChangeAndDoubleClickGivesTheExactDefault)
{
    OpenEditor open;
    for (const auto& knob : knobs)
    {
        auto& slider = open.in<juce::Slider> (knob.panel, knob.slider);
        const auto n = juce::jmax (1, knob.steps);
        EXPECT_NEAR (slider.getValue(), tableDefault (knob.parameter) * n, 0.0005) << knob.slider;
        HostLog host (open.processor);
        slider.setValue (knob.steps > 0 ? 2.0 : 0.2504, juce::sendNotificationSync);
        EXPECT_EQ (host.calls.joinIntoString ("|"), gesture (knob.parameter, knob.steps > 0 ? 2.0 / n : 0.25)) << knob.slider;
        EXPECT_EQ (open.processor.getLastParameterName(), open.processor.getParameterName (knob.parameter));
        // A host change shows at the next poll, rounded to the knob's step, and goes back nowhere.
        host.calls.clear();
        open.processor.setParameter (knob.parameter, 0.59f);
        tick (*open.editor);
        EXPECT_NEAR (slider.getValue(), knob.steps > 0 ? std::round (0.59 * n) : 0.59, 1e-9) << knob.slider;
        EXPECT_TRUE (host.calls.isEmpty()) << knob.slider;
        const auto centre = slider.getLocalBounds().getCentre().toFloat();
        slider.mouseDoubleClick (mouseAt (slider, centre, centre, 2));
        EXPECT_EQ (open.processor.getParameter (knob.parameter), tableDefault (knob.parameter)) << knob.slider;
        EXPECT_EQ (host.calls.size(), 3) << knob.slider;
    }
}

// Sync shows one rate knob and follows the host as the engine reads it; Boost shows a poll after the
// waveshaper for the curves using it; Random and Clear stay lit until a block has served them.
TEST (Switches, SyncBoostLearnModesLastChangeAndRandomAndClearLitUntilABlockServesThem)
{
    OpenEditor open;
    auto& sync = open.in<juce::TextButton> ("Lfo1 Component", "Sync Button");
    auto expectSynced = [&] (bool on) {
        EXPECT_EQ (sync.getToggleState(), on);
        for (auto [name, showsWhenOn] : { std::pair ("Rate Slider", false), { "Rate Label", false }, { "Synced Rate Slider", true }, { "Synced Rate Label", true } })
            EXPECT_EQ (open.in ("Lfo1 Component", name).isVisible(), on == showsWhenOn) << name << " with sync " << on;
    };
    expectSynced (false);
    HostLog host (open.processor);
    click (sync);
    expectSynced (true);
    EXPECT_EQ (host.calls.joinIntoString ("|"), gesture (Param::LFO1Sync, 1.0));
    for (auto [value, on] : { std::pair (0.7f, false), { 1.0f, true } })
    {
        open.processor.setParameter (Param::LFO1Sync, value);
        tick (*open.editor);
        expectSynced (on);
    }

    auto& boost = open.in ("Global Panel", "Boost Slider");
    for (auto [step, visible] : { std::pair (3, true), { 1, false }, { 2, true }, { 0, false } })
    {
        open.processor.setParameter (Param::Waveshaper, (float) step / 3.0f);
        tick (*open.editor);
        EXPECT_EQ (open.in<juce::Slider> ("Global Panel", "Waveshaper Slider").getValue(), step);
        EXPECT_EQ (boost.isVisible(), ! visible) << step;
        tick (*open.editor);
        EXPECT_EQ (boost.isVisible() && open.in ("Global Panel", "Boost Label").isVisible(), visible) << step;
    }

    click (find (*open.editor, "Unlearn Button"));
    EXPECT_TRUE (open.processor.midiUnlearnActive.load() && ! open.processor.midiLearnActive.load());
    click (find (*open.editor, "Learn button"));
    EXPECT_TRUE (open.processor.midiLearnActive.load());
    open.in<juce::Slider> ("Envelope2 Component", "Attack Slider").setValue (0.5, juce::sendNotificationSync);
    EXPECT_TRUE (open.processor.getParameterRecord (Param::Envelope2Attack).learnArmed.load());
    auto shown = [&] { return open.in<juce::Label> ("Global Panel", "Last Parameter Name").getText() + " " + open.in<juce::Label> ("Global Panel", "Last Parameter Value").getText(); };
    tick (*open.editor);
    EXPECT_EQ (shown(), "Envelope2Attack 3.00 Ms");
    auto& random = open.in<juce::TextButton> ("Global Panel", "Random Button");
    auto& clear = find<juce::TextButton> (*open.editor, "Clear Button");
    open.processor.getParameterRecord (Param::MixMode).midiController = 20;
    for (auto* button : { &random, &clear, &clear })
        click (*button);
    tick (*open.editor);   // no audio block yet
    EXPECT_TRUE (random.getToggleState() && clear.getToggleState());
    EXPECT_EQ (shown(), "Randomize On");
    open.processor.serveBlockStartRequests();
    tick (*open.editor);
    EXPECT_FALSE (random.getToggleState() || clear.getToggleState());
    EXPECT_EQ (open.processor.getParameterRecord (Param::MixMode).midiController.load(), -1);
    EXPECT_NEAR (open.in<juce::Slider> ("Delay 1", "Time Slider").getValue(), open.processor.getParameter (Param::Delay1Time), 0.0005);
}

// A name typed while polls run survives a poll before the box's asynchronous change message, and loads
// nothing; Save lists it; item k loads preset k - 1; a name set elsewhere shows at the next poll.
TEST (PresetPanel, TypedNamesSurviveThePollSaveListsThemAndItemKLoadsPresetKMinusOne)
{
    OpenEditor open;
    auto& box = find<juce::ComboBox> (*open.editor, "Preset Box");
    box.addItem ("Init", 1);   // as a list refresh fills it
    box.addItem ("Slapback", 2);
    tick (*open.editor);
    ASSERT_EQ (box.getSelectedId(), 1);
    for (auto [name, nameFromElsewhere] : { std::pair ("My Echo", ""), { "slapback", "Slapback" } })
    {
        auto& text = find<juce::Label> (box);
        text.showEditor();
        text.getCurrentTextEditor()->setText (name);
        if (*nameFromElsewhere != 0)
            open.processor.setPresetName (nameFromElsewhere);   // say, a program change
        tick (*open.editor);
        EXPECT_TRUE (text.isBeingEdited());
        text.hideEditor (false);   // return pressed: the box posts its change message
        tick (*open.editor);
        EXPECT_EQ (box.getText(), name);
        ((juce::AsyncUpdater&) box).handleUpdateNowIfNeeded();   // ComboBox is privately an AsyncUpdater
        EXPECT_EQ (open.processor.getPresetName() + " " + juce::String (open.processor.presetToLoad.load()), juce::String (name) + " -1");
        tick (*open.editor);
        EXPECT_EQ (box.getText(), name);
    }
    click (open.in ("Preset Component", "Save Button"));
    tick (*open.editor);
    const auto names = open.processor.getPresetNames();
    ASSERT_TRUE (names.contains ("slapback") && names.size() >= 2);
    EXPECT_EQ (box.getItemText (names.indexOf ("slapback")) + " " + box.getText(), "slapback slapback");
    for (int id : { 1, 2 })
    {
        box.setSelectedId (id, juce::sendNotificationSync);
        EXPECT_TRUE (open.processor.presetLoadPending.exchange (false));
        EXPECT_EQ (open.processor.presetToLoad.load(), id - 1);
    }
    open.processor.setPresetName (names[0]);
    tick (*open.editor);
    EXPECT_EQ (box.getSelectedId(), 1);
}

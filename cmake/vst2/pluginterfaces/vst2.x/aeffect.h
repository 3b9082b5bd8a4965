// JUCE includes the VST 2.4 interface under its classic names; Debian ships the
// interface as FST. This header forwards to it.
#pragma once
#include "aeffectx.h"

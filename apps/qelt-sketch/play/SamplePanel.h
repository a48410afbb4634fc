#pragma once

#include "ink/Ink.h"

namespace QeltDesktop {

// The panel that shows a pen's settings, in stroke units, each of which is one pixel at a zoom of 1.
constexpr float kPanelWidth = 480.0f;
constexpr float kPanelHeight = 160.0f;

// A page of one stroke for the panel: a lying S that swells, pressed harder and leant further towards its
// middle.
Page samplePanel();

}  // namespace QeltDesktop

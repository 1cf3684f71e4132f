#pragma once

#include "store/MetricValidator.h"
#include "ui/Storyboard.h"

// The interface description: the root navigation stack with the launch screen at the bottom,
// the four screens with their prototype cells, and the row taps that lead from one to the next.
// The screens read `validator`, or without one the shared intake, taken as each screen is made;
// the root navigation stack always takes the shared session and intake.
ui::Storyboard mainInterface(store::MetricValidator* validator = nullptr);

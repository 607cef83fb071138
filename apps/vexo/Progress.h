// Standard error while something takes long: warnings, and a line that says what is going on.
#pragma once

#include <string>

#include "framework/Host.h"

namespace vexo {

void showWarning(const std::string& warning);

// Loads the trees of all plug-ins and waits for them; meanwhile, on a terminal, shows that work goes on.
void loadWithProgress(Host& host);

}  // namespace vexo

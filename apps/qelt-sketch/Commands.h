#pragma once

#include "Options.h"

namespace QeltDesktop {

// What the program does, one function a command. Each writes its output whole or throws: Refusal, or another
// std::exception whose text is one line.

void drawCommand(const Options& options);
void traceCommand(const Options& options);
void previewCommand(const Options& asked);
void sheetCommand(const Options& asked);
void infoCommand(const Options& options);

void runCommand(const Options& options);

}  // namespace QeltDesktop

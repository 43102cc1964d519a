#pragma once

struct HostOptions;
class QenSimProcess;

// The window host: runs the library's start-up order on the Qt event loop, connects (to the
// address given, to the simulator, or to the server the connect dialog names), shows the main
// window and runs the main loop until it closes; then the shut-down order. With --screenshot
// it polls once, opens the windows asked for, writes the main window as a PNG and ends.
class GuiHost {
 public:
  // Returns the process exit code.
  static int Run(int argc, char** argv, HostOptions options, QenSimProcess& sim);
};

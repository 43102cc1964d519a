#pragma once

// A window that knows which of its parts only read. While another client holds the instrument
// the main window asks it to turn off the parts that would change the instrument, instead of
// disabling it whole, so that the user can still look around.
class LockAware {
 public:
  virtual ~LockAware() = default;
  virtual void ShowLock(bool locked) = 0;
};

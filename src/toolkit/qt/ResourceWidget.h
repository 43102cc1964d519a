#pragma once

// A widget of the library that has work to do once a resource has set its attributes (a
// bound control registers with the engine then). The resource loader calls it.
class ResourceWidget {
 public:
  virtual ~ResourceWidget() = default;
  virtual void NfyInit() = 0;
};

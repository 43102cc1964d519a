#pragma once

// Offers the grid base, its display columns and every grid editor to the resource loader's
// class table, under the class names a resource uses ("GridManager", "DigitDisp").
class GridClasses {
 public:
  static void AddFactories();
};

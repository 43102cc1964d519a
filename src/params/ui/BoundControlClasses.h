#pragma once

// Offers the bound controls and unit labels to the resource loader's class table, under the
// class names a resource uses ("QenParEd", "UnitEd").
class BoundControlClasses {
 public:
  static void AddFactories();
};

#pragma once

// The keys that move a grid's cursor, as every grid model takes them from its view.
enum class GridKey { kUp, kDown, kLeft, kRight, kPageUp, kPageDown, kHome, kEnd };

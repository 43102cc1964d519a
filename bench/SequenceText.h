#pragma once

// Sequence expressions of the second generation for the benchmarks: blocks of ten data ports,
// runs of blocks, one-block loops and two-block loops inside endless top-level loops (three
// loop levels), with labels.
#include <string>

namespace sequence_text {

inline std::string Block(int i) {
  std::string ports;
  for (int p = 0; p < 10; ++p)
    ports += p % 3 == 0 ? ",\"seg" + std::to_string(i % 97) + "\",0,0" : ",PAUSE0,0,0";
  return "(BLOCK," + std::to_string(i % 7) + "," + std::to_string(1024 + 64 * (i % 50)) + ",0,\"\",()" +
         ports + ")";
}

// Item `i` of a long sequence of the second generation: runs of blocks, one-block loops and
// two-block loops inside endless top-level loops, with labels. `blocks` counts what it adds.
inline std::string Item(int i, int& blocks) {
  std::string item = i == 0 ? "," : ",\"l" + std::to_string(i) + "\",";
  if (i % 5 == 0) {
    blocks += 3;
    return item + "(LOOP3,0,INF,\"\",(SEQ," + Block(i) + ",\"\",(LOOP1,1,4,\"\",(SEQ," + Block(i + 1) +
           ",\"\"," + Block(i + 2) + "))))";
  }
  blocks += 1;
  return item +
         (i % 5 == 1 ? "(LOOP2,0," + std::to_string(i % 100 + 1) + ",\"\"," + Block(i) + ")" : Block(i));
}

// A sequence of at least `minimumBlocks` blocks.
inline std::string MakeBlocks(int minimumBlocks) {
  std::string text = "(3.0,\"start\",(SEQ";
  int blocks = 0;
  for (int i = 0; blocks < minimumBlocks; ++i) text += Item(i, blocks);
  return text + "))";
}

}  // namespace sequence_text

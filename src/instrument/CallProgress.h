#pragma once

// Follows one call that may keep the server busy for long (a fill or a search over a huge
// segment). While the reply is awaited it is told, about ten times a second, how far the
// server is: `done` of `total` in the server's own units, or -1 for both while the server
// has said nothing. Returning true asks the server to cancel the command; it then puts back
// what it changed and answers with an error.
class CallProgress {
 public:
  virtual ~CallProgress() = default;
  virtual bool Tick(long long done, long long total) = 0;
};

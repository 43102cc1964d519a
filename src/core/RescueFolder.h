#pragma once

#include <vector>

#include "segments/QenSegmentDs.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

class CSequence;

// A folder of work that was not saved when the server died, in files a user can read and
// import by hand: each segment in the segment editor's text form (hexadecimal digits for the
// coding "01"), whole or only the vectors this side held; the sequence expression last read;
// and the list "rescue.txt" that names them, written last, so that a folder without it was
// cut short and is never offered. The answer to the offer is kept in "answer.txt": a folder
// with an answer is not offered again.
class RescueFolder {
 public:
  struct Segment {
    Dstring name;
    Dstring file;
    QenSegmentDs::HeldText held;  // without its text once read back
  };

  static constexpr const char* kListName = "rescue.txt";
  static constexpr const char* kAnswerName = "answer.txt";
  static constexpr const char* kSequenceName = "sequence.txt";

  // Writes the segments' texts and the sequence (when not empty) into `path`, made if
  // missing, then the list. `written` is the time shown to the user.
  static int Write(const Dstring& path, const Dstring& written, const std::vector<Segment>& segments,
                   const Dstring& sequence, ConditionList& list);
  static int Read(const Dstring& path, RescueFolder& folder, ConditionList& list);
  // The folders under `root` with a whole list and no answer, oldest first.
  static std::vector<Dstring> Pending(const Dstring& root);

  const Dstring& GetPath() const { return mPath; }
  const Dstring& GetWritten() const { return mWritten; }
  const std::vector<Segment>& GetSegments() const { return mSegments; }
  bool HasSequence() const { return !mSequenceFile.empty(); }
  // "the segments "a" and "b" and the sequence".
  Dstring Summary() const { return Summary(mSegments, HasSequence()); }
  static Dstring Summary(const std::vector<Segment>& segments, bool sequence);
  // Each segment put back and saved under its name (its coding and width first made what they
  // were), then the sequence written; stops at the first refusal, which names what was put
  // back before it.
  int PutBack(CSequence& sequence, ConditionList& list) const;
  int Answer(const Dstring& answer, ConditionList& list) const;

 private:
  int PutBackSegment(const Segment& segment, ConditionList& list) const;

  Dstring mPath;
  Dstring mWritten;
  std::vector<Segment> mSegments;
  Dstring mSequenceFile;
};

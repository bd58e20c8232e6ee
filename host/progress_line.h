// The one-line progress a run shows on a terminal: "[<done> of <found> files] <step>", rewritten in
// place with '\r' (and "\033[K" to blank the rest) at most ten times a second, and cleared before
// anything else is printed and when the run ends. Shown only when standard error is a terminal and the user did not ask for -q.

#ifndef VXMIGRATE_HOST_PROGRESS_LINE_H_
#define VXMIGRATE_HOST_PROGRESS_LINE_H_

#include <cstdio>
#include <string>

class ProgressLine {
 public:
  // err is not owned; the line stays off unless Enable is called.
  explicit ProgressLine(FILE* err) : err_(err) {}
  ~ProgressLine() { Clear(); }

  ProgressLine(const ProgressLine&) = delete;
  ProgressLine& operator=(const ProgressLine&) = delete;

  // Turns the line on when err is a terminal; "found" counts the files of the source installation
  // (the line shows at least the files done, should the run write more).
  void Enable(const std::string& source);
  bool Enabled() const { return enabled_; }

  // Draws the line unless it was drawn less than a tenth of a second ago. step: the run's last log
  // entry; control bytes show as blanks and the line is cut to the terminal's width.
  void Update(const std::string& step, long done);
  // Blanks the line, so that the next output starts at the start of an empty line.
  void Clear();

 private:
  FILE* err_;
  bool enabled_ = false;
  long found_ = 0;
  int width_ = 80;
  bool drawn_ = false;       // the line shows a text now
  long long lastDrawn_ = 0;  // monotonic milliseconds; 0 before the first draw
};

#endif  // VXMIGRATE_HOST_PROGRESS_LINE_H_

// What a worker sends to the program: frames of a kind, a size and that many bytes.
#ifndef MERO_TOOLS_FRAMES_H
#define MERO_TOOLS_FRAMES_H

#include <optional>
#include <string>
#include <string_view>

struct Frame {
  enum class Kind : char { kLine = 'L', kResult = 'R' };

  Kind kind;
  std::string bytes;
};

// Ends the process when nobody can read the frame any more: then nobody wants what it works for.
void SendFrame(int fd, Frame::Kind kind, std::string_view bytes);

class Frames {
 public:
  // Reads what there is; false at the end.
  bool Read(int fd);

  // The next one that has been read whole.
  std::optional<Frame> Next();

 private:
  std::string received_;
};

#endif  // MERO_TOOLS_FRAMES_H

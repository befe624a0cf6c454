#pragma once

#include <ostream>
#include <streambuf>
#include <string>

namespace vexel_yaml {

/// Hands text on to another stream's buffer with everything escaped that a terminal would take for a command:
/// control characters but line break and tab, the same range of Unicode (U+0080 to U+009F), and bytes that
/// are no UTF-8 each become "\x" and two digits. Keys, values and file names come from repositories; a
/// terminal that obeyed them could be made to hide the conflict that it shows.
class EscapingBuffer : public std::streambuf {
 public:
  explicit EscapingBuffer(std::streambuf& target) : target_(target) {}
  EscapingBuffer(const EscapingBuffer&) = delete;
  EscapingBuffer& operator=(const EscapingBuffer&) = delete;
  ~EscapingBuffer() override;

 protected:
  int_type overflow(int_type character) override;
  int sync() override;

 private:
  bool Put(char byte);
  bool EndSequence();
  bool PutEscaped(char byte);

  std::streambuf& target_;
  // The beginning of a character of several bytes.
  std::string sequence_;
};

/// An EscapingBuffer for a terminal, on which a line of progress makes room for the text.
class TerminalBuffer : public EscapingBuffer {
 public:
  using EscapingBuffer::EscapingBuffer;

 protected:
  int_type overflow(int_type character) override;
};

/// Lets a stream escape, in its lifetime, if its descriptor is a terminal. Files and pipes get every byte.
class TerminalOutput {
 public:
  TerminalOutput(std::ostream& stream, int descriptor);
  TerminalOutput(const TerminalOutput&) = delete;
  TerminalOutput& operator=(const TerminalOutput&) = delete;
  ~TerminalOutput();

 private:
  std::ostream& stream_;
  std::streambuf* previous_;
  TerminalBuffer buffer_;
};

}  // namespace vexel_yaml

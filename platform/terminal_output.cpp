#include "platform/terminal_output.h"

#include <unistd.h>

#include <utility>

#include "platform/progress.h"

namespace vexel_yaml {

namespace {

// How many bytes a character has that begins with `lead`; 0 for what begins none.
size_t SequenceLength(unsigned char lead) {
  if (lead >= 0xC2 && lead <= 0xDF) return 2;
  if (lead >= 0xE0 && lead <= 0xEF) return 3;
  return lead >= 0xF0 && lead <= 0xF4 ? 4 : 0;
}

bool IsControl(unsigned char byte) { return (byte < 0x20 && byte != '\n' && byte != '\t') || byte == 0x7F; }

// Whether the bytes are one character, written as short as possible, and no control character: some terminals
// obey those beyond ASCII, too, and read the long forms.
bool IsHarmless(const std::string& sequence) {
  const auto lead = static_cast<unsigned char>(sequence[0]);
  if (sequence.size() != SequenceLength(lead)) return false;
  const auto second = static_cast<unsigned char>(sequence[1]);
  switch (lead) {
    case 0xC2:
    case 0xE0:
      return second >= 0xA0;
    case 0xED:  // Halves of characters follow.
      return second < 0xA0;
    case 0xF0:
      return second >= 0x90;
    case 0xF4:  // Beyond the last character there is.
      return second < 0x90;
    default:
      return true;
  }
}

}  // namespace

EscapingBuffer::~EscapingBuffer() { EndSequence(); }

EscapingBuffer::int_type EscapingBuffer::overflow(int_type character) {
  if (traits_type::eq_int_type(character, traits_type::eof())) return traits_type::not_eof(character);
  return Put(traits_type::to_char_type(character)) ? character : traits_type::eof();
}

// What is not complete yet waits: the stream is flushed between any two pieces of a text.
int EscapingBuffer::sync() { return target_.pubsync(); }

bool EscapingBuffer::Put(char byte) {
  const auto number = static_cast<unsigned char>(byte);
  if (!sequence_.empty() && (number & 0xC0U) == 0x80) {
    sequence_ += byte;
    return sequence_.size() < SequenceLength(static_cast<unsigned char>(sequence_[0])) || EndSequence();
  }
  // What was begun is not a character.
  bool good = EndSequence();
  if (SequenceLength(number) > 0) {
    sequence_ = byte;
    return good;
  }
  if (number >= 0x80 || IsControl(number)) return PutEscaped(byte) && good;
  return target_.sputc(byte) != traits_type::eof() && good;
}

bool EscapingBuffer::EndSequence() {
  if (sequence_.empty()) return true;
  const std::string sequence = std::exchange(sequence_, {});
  if (IsHarmless(sequence)) {
    const auto size = static_cast<std::streamsize>(sequence.size());
    return target_.sputn(sequence.data(), size) == size;
  }
  bool good = true;
  for (const char byte : sequence) good = PutEscaped(byte) && good;
  return good;
}

bool EscapingBuffer::PutEscaped(char byte) {
  constexpr char kDigits[] = "0123456789abcdef";
  const auto number = static_cast<unsigned char>(byte);
  const char text[] = {'\\', 'x', kDigits[number >> 4U], kDigits[number & 0xFU]};
  return target_.sputn(text, sizeof(text)) == sizeof(text);
}

TerminalBuffer::int_type TerminalBuffer::overflow(int_type character) {
  Progress::MakeRoom();
  return EscapingBuffer::overflow(character);
}

TerminalOutput::TerminalOutput(std::ostream& stream, int descriptor)
    : stream_(stream), previous_(stream.rdbuf()), buffer_(*previous_) {
  if (isatty(descriptor) != 0) stream_.rdbuf(&buffer_);
}

TerminalOutput::~TerminalOutput() {
  stream_.flush();
  // Another buffer makes the stream forget that a write failed.
  const auto state = stream_.rdstate();
  stream_.rdbuf(previous_);
  stream_.setstate(state);
}

}  // namespace vexel_yaml

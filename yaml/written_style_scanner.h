#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

#include "yaml/written_scalars.h"
#include "yaml/written_style.h"
#include "yaml/written_style_characters.h"

namespace vexel_yaml::written_style {

// Far from every limit on nesting.
inline constexpr ptrdiff_t kWidestIndent = 200;
// Mappings with more keys are rare, and looking for repeated ones would get slow.
inline constexpr size_t kMostKeys = 64;

inline std::string_view View(const char* begin, const char* end) {
  return {begin, static_cast<size_t>(end - begin)};
}

enum class ScalarStyle : uint8_t { kPlain, kDoubleQuoted };

// A block collection that is open at the current line, or one in brackets.
struct Level {
  ptrdiff_t column;
  bool is_sequence;
  // Of the keys, which lie on the scanner's stack from this one on.
  size_t first_key;
  // A bit that several keys may share, for each key: most new keys set one that is not set yet.
  uint64_t key_bits;
};

// Goes over one document, whose last character must be a line break: that stops every loop. `Sink` is told,
// in document order, what is found: NextLine, Open(is_sequence, is_flow), Key, Scalar (the text as it stands,
// without its quotes; empty for a key without a value) and Close. What it was told counts only if `Scan`
// returns true.
template <typename Sink>
class StyleScanner {
 public:
  StyleScanner(std::string_view document, WrittenDocument& result, Sink& sink)
      : begin_(document.data()),
        end_(begin_ + document.size()),
        at_(begin_),
        copied_(begin_),
        result_(result),
        sink_(sink) {}

  bool Scan() {
    if (!ScanHeaderLine() || at_ == end_ || !ScanBodyKey()) return false;
    while (at_ != end_) {
      if (!ScanLine()) return false;
    }
    if (!has_fields_) return false;
    if (takes_block_) sink_.Scalar({}, ScalarStyle::kPlain);
    while (depth_ > 0) Close();
    if (copied_ != begin_) result_.transcript.append(copied_, end_);
    return true;
  }

 private:
  bool Take(std::string_view text) {
    if (static_cast<size_t>(end_ - at_) < text.size() || std::memcmp(at_, text.data(), text.size()) != 0) {
      return false;
    }
    at_ += text.size();
    return true;
  }

  std::string_view TakeWhile(uint8_t bits) {
    const char* begin = at_;
    while (Is(*at_, bits)) ++at_;
    return View(begin, at_);
  }

  // "--- !v!1 &10 stripped"
  bool ScanHeaderLine() {
    if (!Take("--- !v!")) return false;
    result_.class_id = TakeWhile(kDigit);
    if (result_.class_id.empty() || result_.class_id.size() > 10 || !Take(" &")) return false;
    const char* file_id = at_;
    if (*at_ == '-') ++at_;
    const size_t digits = TakeWhile(kDigit).size();
    result_.file_id = View(file_id, at_);
    result_.stripped = Take(" stripped");
    return digits > 0 && digits < 20 && Take("\n");
  }

  // The class name on a line of its own: all else is below it.
  bool ScanBodyKey() {
    line_ = at_;
    sink_.NextLine();
    if (!ScanKey(result_.body_key) || !Take("\n")) return false;
    // Their transitions become a list before any diff.
    if (result_.body_key == "AnimatorStateMachine") return false;
    Open(0, false, false);
    takes_block_ = true;
    return AddKey(result_.body_key);
  }

  // A key with its colon.
  bool ScanKey(std::string_view& key) {
    const char* begin = at_;
    if (!StepOverKey(at_)) return false;
    key = View(begin, at_);
    // The names that stand for what the header line says.
    if (key.starts_with("MERGE_") || *at_ != ':') return false;
    ++at_;
    return true;
  }

  bool AddKey(std::string_view key) {
    Level& level = levels_[depth_ - 1];
    const auto at = [&](size_t i) { return size_t{static_cast<uint8_t>(key[i])}; };
    const size_t hash = key.size() * 5 + at(key.size() - 1) * 3 + at(key.size() / 2) * 7 + at(key.size() / 3);
    const uint64_t bit = uint64_t{1} << (hash % 64);
    if ((level.key_bits & bit) != 0 && HoldsKey(level, key)) return false;
    if (key_count_ == keys_.size() || key_count_ - level.first_key == kMostKeys) return false;
    level.key_bits |= bit;
    keys_[key_count_++] = {key.data(), key.size()};
    sink_.Key(key);
    return true;
  }

  bool HoldsKey(const Level& level, std::string_view key) const {
    for (size_t i = level.first_key; i < key_count_; ++i) {
      if (std::string_view(keys_[i].text, keys_[i].size) == key) return true;
    }
    return false;
  }

  // The indent bounds the depth.
  void Open(ptrdiff_t column, bool is_sequence, bool is_flow) {
    levels_[depth_++] = {column, is_sequence, key_count_, 0};
    sink_.Open(is_sequence, is_flow);
  }

  void Close() {
    key_count_ = levels_[--depth_].first_key;
    sink_.Close();
  }

  // The next line is an entry of an open collection, or opens the block that the key before it waits for.
  bool ScanLine() {
    line_ = at_;
    sink_.NextLine();
    while (*at_ == ' ') ++at_;
    const ptrdiff_t column = at_ - line_;
    if (column > kWidestIndent) return false;
    if (at_[0] == '-' && at_[1] == ' ') {
      at_ += 2;
      return EnterSequence(column) && ScanItem(column + 2);
    }
    return EnterMapping(column) && ScanEntry();
  }

  bool EnterSequence(ptrdiff_t column) {
    // At column 0 the object would be a list.
    if (column == 0) return false;
    if (takes_block_ && levels_[depth_ - 1].column == column) {
      Open(column, true, false);
      return true;
    }
    if (takes_block_) sink_.Scalar({}, ScalarStyle::kPlain);
    while (levels_[depth_ - 1].column > column) Close();
    return levels_[depth_ - 1].is_sequence && levels_[depth_ - 1].column == column;
  }

  bool EnterMapping(ptrdiff_t column) {
    // At column 0 the object would have a second key.
    if (column == 0) return false;
    if (takes_block_ && levels_[depth_ - 1].column + 2 == column) {
      Open(column, false, false);
      return true;
    }
    if (takes_block_) sink_.Scalar({}, ScalarStyle::kPlain);
    while (levels_[depth_ - 1].column > column ||
           (levels_[depth_ - 1].is_sequence && levels_[depth_ - 1].column == column)) {
      Close();
    }
    return levels_[depth_ - 1].column == column;
  }

  // What stands behind a dash: a value, or the first key of a mapping.
  bool ScanItem(ptrdiff_t column) {
    takes_block_ = false;
    if (*at_ == '{' || *at_ == '[') return ScanFlow() && Take("\n");
    const char* begin = at_;
    std::string_view key;
    if (ScanKey(key) && (*at_ == ' ' || *at_ == '\n')) {
      at_ = begin;
      Open(column, false, false);
      return ScanEntry();
    }
    at_ = begin;
    return ScanScalar();
  }

  bool ScanEntry() {
    std::string_view key;
    if (!ScanKey(key) || !AddKey(key)) return false;
    takes_block_ = false;
    has_fields_ = true;
    const char* value = at_;
    if (!ScanValue()) return false;
    if (key == "m_Father") {
      if (depth_ == 2) NoteFather(View(value, at_));
    } else if (key == "m_PrefabInternal") {
      result_.refers_to_prefab |= View(value, at_) != " {fileID: 0}\n";
    }
    return true;
  }

  void NoteFather(std::string_view value) {
    constexpr std::string_view kReference = " {fileID: ";
    if (!value.starts_with(kReference)) return;
    value.remove_prefix(kReference.size());
    const size_t end = value.find_first_not_of("0123456789-");
    if (value.substr(end) == "}\n") result_.father = value.substr(0, end);
  }

  // What stands behind a key's colon, up to the end of the line.
  bool ScanValue() {
    if (*at_ == '\n') {
      takes_block_ = true;
      ++at_;
      return true;
    }
    if (*at_ != ' ') return false;
    ++at_;
    if (*at_ == '\n') {
      // Engines write the blank, libyaml doesn't.
      result_.transcript.append(copied_, at_ - 1);
      copied_ = at_++;
      takes_block_ = true;
      return true;
    }
    if (*at_ == '{' || *at_ == '[') return ScanFlow() && Take("\n");
    return ScanScalar();
  }

  // A value that the line ends with, or one of the lines that follow.
  bool ScanScalar() {
    if (*at_ == '"') return TakeQuoted(SkipDoubleQuoted, ScalarStyle::kDoubleQuoted);
    if (*at_ == '\'') return TakeQuoted(SkipSingleQuoted, ScalarStyle::kPlain);
    return ScanPlain();
  }

  bool ScanPlain() {
    const char* begin = at_;
    if (!StepOverPlainStart(at_)) return false;
    const char* end = nullptr;
    do {
      if (!ScanPlainLine()) return false;
      end = at_ - 1;
    } while (EnterNextLineOfValue());
    sink_.Scalar(View(begin, end), ScalarStyle::kPlain);
    return true;
  }

  bool ScanPlainLine() {
    for (;; ++at_) {
      at_ = SkipPlainWord(at_);
      if (*at_ == '\n') break;
      if (!IsInsidePlain(at_) || !IsPlainBlank(at_, line_)) return false;
    }
    ++at_;
    return true;
  }

  // Steps into the line that continues a plain value, which libyaml breaks at the first blank beyond its best
  // width. Elsewhere a break would be moved.
  bool EnterNextLineOfValue() {
    const ptrdiff_t width = at_ - 1 - line_;
    const ptrdiff_t indent = levels_[depth_ - 1].column + 2;
    if (width <= kBestWidth || end_ - at_ <= indent) return false;
    for (ptrdiff_t i = 0; i < indent; ++i) {
      if (at_[i] != ' ') return false;
    }
    if (!Is(at_[indent], kFirst)) return false;
    line_ = at_;
    sink_.NextLine();
    at_ += indent + 1;
    return true;
  }

  bool TakeQuoted(const char* (*skip)(const char*, const char*), ScalarStyle style) {
    const char* begin = at_ + 1;
    const char* end = skip(at_, line_);
    if (end == nullptr) return false;
    at_ = end;
    if (!Take("\n")) return false;
    sink_.Scalar(View(begin, end - 1), style);
    return true;
  }

  // "{}", "[]", "{key: value, key: value}" or "[value, value]" with plain values.
  bool ScanFlow() {
    const bool is_mapping = *at_++ == '{';
    const char close = is_mapping ? '}' : ']';
    Open(at_ - line_, !is_mapping, true);
    if (*at_ == close) {
      ++at_;
      Close();
      return true;
    }
    for (;;) {
      if (at_ - line_ > kBestWidth) return false;
      if (at_[-1] == ',' && !Take(" ")) return false;
      if (is_mapping && !ScanFlowKey()) return false;
      const char* value = at_;
      if (!StepOverPlainStart(at_)) return false;
      TakeWhile(kFlow);
      sink_.Scalar(View(value, at_), ScalarStyle::kPlain);
      if (*at_ == close) break;
      if (*at_++ != ',') return false;
    }
    ++at_;
    Close();
    return true;
  }

  bool ScanFlowKey() {
    std::string_view key;
    return ScanKey(key) && AddKey(key) && Take(" ");
  }

  // The text of a key; without members that would have to be initialized a thousand times a document.
  struct Key {
    const char* text;
    size_t size;
  };

  const char* const begin_;
  const char* const end_;
  const char* at_;
  // All before it stands in the transcript, if that was begun.
  const char* copied_;
  const char* line_ = nullptr;
  WrittenDocument& result_;
  Sink& sink_;
  std::array<Level, kWidestIndent + 8> levels_;
  size_t depth_ = 0;
  // The keys of all open collections, the innermost one's last.
  std::array<Key, 512> keys_;
  size_t key_count_ = 0;
  // Whether the line before ended in a key without a value.
  bool takes_block_ = false;
  bool has_fields_ = false;
};

}  // namespace vexel_yaml::written_style

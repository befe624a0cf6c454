#pragma once

#include <algorithm>
#include <cstdlib>
#include <initializer_list>
#include <random>
#include <string>

namespace vexel_yaml {

/// Documents that live on the edges of the dialect: mostly as engines write, with everything near it that
/// they don't, and at times with a byte changed.
class EdgeDocuments {
 public:
  /// How many the tests should go through.
  static long CountToTry() {
    const char* wanted = std::getenv("VEXEL_EDGE_DOCUMENTS");
    return wanted == nullptr ? 20'000 : std::atol(wanted);
  }

  explicit EdgeDocuments(uint32_t seed) : random_(seed) {}

  std::string Next() {
    text_ = Pick({"--- !v!1 &10\n", "--- !v!4 &-7 stripped\n", "--- !v!114 &8679921383154817045\n",
                  Rarely(40) ? "--- !v!1 &1 \n" : "--- !v!2 &2\n"});
    text_ += Pick({"Transform:\n", "GameObject:\n", "MonoBehaviour:\n"});
    if (Rarely(60)) text_ += Pick({"  # note\n", "...\n", "\n", "Second: 1\n", "- 1\n", "%YAML 1.1\n"});
    Mapping(2);
    for (int i = Rarely(3) ? 1 + Below(2) : 0; i > 0; --i) Mutate();
    return text_;
  }

 private:
  size_t Below(size_t count) { return random_() % count; }
  bool Rarely(size_t times) { return Below(times) == 0; }
  std::string Pick(std::initializer_list<std::string> texts) {
    return *(texts.begin() + Below(texts.size()));
  }

  // One of the lines of `texts`.
  std::string PickLine(const std::string& texts) {
    size_t begin = 0;
    for (size_t i = Below(1 + static_cast<size_t>(std::ranges::count(texts, '\n'))); i > 0; --i) {
      begin = texts.find('\n', begin) + 1;
    }
    return texts.substr(begin, texts.find('\n', begin) - begin);
  }

  std::string Key() {
    if (!Rarely(30))
      return "m_" + std::string(1, static_cast<char>('a' + Below(26))) + std::to_string(Below(4));
    return Rarely(4) ? std::string(127 + Below(3), 'k') + (Rarely(3) ? std::string(896, 'k') : "")
                     : PickLine(
                           "m_Father\nm_PrefabInternal\nMERGE_FileID\na b\na.b\n<n>k\n-\n1\na-\n? k\n'q'\n"
                           "\"q\"\n\n~\n=\n<<\n*a\na#\na:b\n\xC3\xA4");
  }

  std::string Plain() {
    if (!Rarely(4)) return Pick({"0", "1", "-0.5", "1e-05", "Lamp", "Street Lamp", "a/b.c", "Untagged"});
    const std::string wide(60 + Below(24), 'w');
    return Rarely(6)
               ? wide + (Rarely(3) ? "\n    x x" : PickLine("\n x\n xx x"))
               : PickLine(
                     "'a: b'\n'#a'\n'-'\na: b\na :b\na:b\na:\na #b\na#b\n#a\n a\na \na  "
                     "b\n'a'\n\"a\"\nit's\n-\n--\n---\n"
                     "--- a\n-a\n- a\n..\n...\n.5\n?\n? a\n?a\n:a\n&a\n*a\n!a\n!v!1 a\n|\n>\n|-\n%a\n"
                     "@a\n`a\n~\nnull\n=\n<<\na,b\na, b\na]\n[a\n{a\na}\na\tb\n\ta\na\x01\n\xC3\xA4\n"
                     "\xFF\n\x7F\n\xE2\x80\xA8\na\rb\na?b\na&b\n(a)\n$a\na\\n\n1_000\n0x1f\n1:30\n;a\n"
                     "+1\na'b \"c\na\xC2\x85\n%YAML\n\"\\xE9t\\xE9\"\n\"\\u20AC\"\n\"\\xA0\"\n\"\\uD800\"");
  }

  std::string FlowValue() { return Rarely(12) ? Plain() : Pick({"0", "1", "0.5", "-3", "abc", "0f"}); }

  std::string Flow() {
    std::string text = "{fileID: " + Pick({"0", "11", "-5"});
    if (Rarely(3)) return text + "}";
    const bool list = Rarely(4);
    text = list ? "[" : "{";
    const size_t count = Rarely(6) ? Below(14) : Below(4);
    for (size_t i = 0; i < count; ++i) {
      if (i > 0) text += Rarely(40) ? Pick({",", ",  ", " , ", ",\n    "}) : ", ";
      if (!list)
        text += (Rarely(4) ? Key() : std::string(1, static_cast<char>('a' + i))) + (Rarely(50) ? ":" : ": ");
      text += Rarely(30) ? Flow() : FlowValue();
    }
    return text + (Rarely(60) ? "" : list ? "]" : "}");
  }

  std::string Value() {
    if (Rarely(3)) return Flow();
    return Rarely(8) ? Pick({"", "[]", "{}", "[ ]", "{ }", "&x 1", "|\n    text"}) : Plain();
  }

  std::string Indent(size_t column) { return std::string(Rarely(60) ? column + 1 : column, ' '); }

  void Mapping(size_t column) {
    for (size_t i = 1 + Below(Rarely(20) ? 70 : 5); i > 0; --i) {
      text_ += Indent(column);
      Entry(column);
    }
  }

  void Entry(size_t column) {
    text_ += Key() + (Rarely(80) ? Pick({"", " :", "::"}) : ":");
    if (column < 9 && Rarely(5)) {
      text_ += Rarely(20) ? " \n" : "\n";
      if (Rarely(2)) {
        Mapping(column + (Rarely(20) ? 4 : 2));
      } else {
        Sequence(Rarely(20) ? column + 2 : column);
      }
      return;
    }
    const std::string value = Value();
    text_ += (value.empty() && Rarely(2) ? "" : " ") + value +
             (Rarely(60) ? Pick({" \n", "\r\n", " # x\n"}) : "\n");
  }

  void Sequence(size_t column) {
    for (size_t i = 1 + Below(4); i > 0; --i) {
      text_ += Indent(column) + (Rarely(40) ? Pick({"-", "-  ", "-\n", "- - "}) : "- ");
      if (!Rarely(3)) {
        text_ += Value() + "\n";
        continue;
      }
      Entry(column + 2);
      for (size_t more = Below(3); more > 0; --more) {
        text_ += Indent(column + 2);
        Entry(column + 2);
      }
    }
  }

  void Mutate() {
    const size_t at = Below(text_.size());
    static const std::string kBytes = "\n\n :-{}[],'\"#&*!|>%@?\t\r\x01\x7F\xC3~x0";
    switch (Below(4)) {
      case 0:
        text_[at] = kBytes[Below(kBytes.size())];
        return;
      case 1:
        text_.insert(at, 1, kBytes[Below(kBytes.size())]);
        return;
      case 2:
        text_.erase(at, 1 + Below(3));
        return;
      default:
        text_.resize(at + 1);
    }
  }

  std::mt19937 random_;
  std::string text_;
};

}  // namespace vexel_yaml

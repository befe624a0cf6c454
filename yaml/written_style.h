#pragma once

#include <string>
#include <string_view>

namespace vexel_yaml {

/// What one pass over a document in the written style finds out. The views refer to the document's text.
struct WrittenDocument {
  std::string_view class_id;
  std::string_view file_id;
  bool stripped = false;
  /// The object's one key, its class name.
  std::string_view body_key;
  /// The file ID in the body's "m_Father: {fileID: ...}"; empty where no such line stands there.
  std::string_view father;
  /// Whether an "m_PrefabInternal" stands anywhere whose value is not just "{fileID: 0}".
  bool refers_to_prefab = false;
  /// The text as it is written, where that is not the very text that was scanned; else empty.
  std::string transcript;
};

/// Whether `document` (from its "---" line to the next document) is known to be in the written style: reading
/// it and writing it again gives `document` itself or `result.transcript`, no mapping in it repeats a key,
/// and it is nowhere near the limits on hostile input.
///
/// Knows the dialect that engines write: block mappings and sequences, one-line flow collections of plain
/// values, plain values of harmless characters, quoted ones of the frequent kinds. It never guesses: for a
/// document with anything else in it (comments, nested brackets, raw UTF-8) it returns false, and libyaml has
/// to read it. State machines, whose transitions must be taken apart, are never known, either.
///
/// `document` must stand behind a header for which `IsWrittenHeader` holds.
bool IsInWrittenStyle(std::string_view document, WrittenDocument& result);

/// Whether `header` (all before the first document) is the two directives as they are written.
bool IsWrittenHeader(std::string_view header);

}  // namespace vexel_yaml

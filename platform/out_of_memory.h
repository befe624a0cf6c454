#pragma once

namespace vexel_yaml {

/// Ends the process with status 1 and the line "Out of memory" on standard error, once its temporary files
/// are gone. Allocates nothing and may be called from any thread; the first one to call it prints.
///
/// `operator new` does this in place of throwing. An exception could not be relied on: streams swallow it and
/// lose the text they were given, destructors and thread starts turn it into an abort, and the packaged
/// allocator aborts without a word. A merge has nothing to save when memory is gone but the files that stand,
/// and those are untouched until the result is complete.
[[noreturn]] void EndOutOfMemory() noexcept;

}  // namespace vexel_yaml

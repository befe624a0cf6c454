#pragma once

#include <sys/types.h>

#include <string>
#include <string_view>
#include <vector>

namespace vexel_yaml {

/// Files that are written where others may have put something under any name.

/// Writes the file, whole or not at all. One that is there keeps its permissions, a new one gets `mode` as
/// far as the user's mask has it. False where it can't, also for a folder or a symbolic link, which could
/// lead anywhere. The work file beside it has a name that can't be foreseen, so that no repository can have
/// one of that name.
bool PutFile(const std::string& path, std::string_view text, mode_t mode = 0666);

/// The same for a file of the user's own, whose symbolic links are meant to be followed. Throws CommandError.
void ReplaceOwnFile(const std::string& path, std::string_view text);

/// Where a path leads to in the end, without symbolic links. The file itself need not exist.
std::string TargetOf(const std::string& path);

/// Whether a path of the work tree, which is the current folder, is a file or free, and no folder on its way
/// is a symbolic link. What lies behind a link isn't the repository's.
bool IsPlain(const std::string& path);

/// Whether a symbolic link of the work tree, which is the current folder, is on the way to this absolute
/// path.
bool LeavesTop(const std::string& path);

bool IsLink(const std::string& path);
/// A regular file, or a link to one.
bool IsFile(const std::string& path);
bool IsFolder(const std::string& path);

/// Makes the folders up to the last "/" of the path. False where it can't.
bool MakeFoldersFor(const std::string& path);

/// Whether there is nothing in the file, or no file.
bool IsEmpty(const std::string& path);

/// The content of a file, empty where there is none. Throws FileError for one that can't be read.
std::string TextOf(const std::string& path);

/// What is in a folder; nothing where there is none. Throws FileError for one that can't be read.
std::vector<std::string> PathsIn(const std::string& folder);

/// Whether the file is in the engine's text format, and not one of its plain .meta files, binary, or a
/// pointer to a file elsewhere.
/// Throws FileError for one that can't be read.
bool IsAsset(const std::string& path);

/// Makes a new file from a pattern that ends in "XXXXXX", which becomes a name that was free. False where it
/// can't.
bool MakeCopy(std::string& pattern, std::string_view text);

}  // namespace vexel_yaml

#pragma once

#include <string>

namespace vexel_yaml {

/// The native form of a path: on the systems supported, the path itself.
std::string VexelToNativePath(const std::string& path);

/// Whether something stands at `path`.
bool FileExists(const std::string& path);

/// Whether the file holds no byte. One that cannot be opened counts as empty, one that cannot
/// be read does not.
bool IsFileEmpty(const std::string& path);

/// The text after the last "." anywhere in `path` (in a folder's name too), empty where there is none.
std::string GetFileExtension(const std::string& path);

/// The value of HOME, empty when it is not set.
std::string GetUserHomeDir();

/// The folder of the running executable with its trailing separator, symbolic links resolved: there lie the
/// default "mergerules.txt" and "mergespecfile.txt". Empty after an error, which has been reported.
std::string GetDataFilesDir();

/// The path of a data file of that name, empty where the folder is not known: a bare name would be looked for
/// in the current folder, where a stranger's repository may have put one.
std::string GetDataFilePath(const std::string& name);

}  // namespace vexel_yaml

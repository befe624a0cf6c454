#include "platform/file_error.h"

#include <system_error>

namespace vexel_yaml {

FileError::FileError(Step step, const std::string& path, int error_number)
    : std::runtime_error((step == Step::kReading ? "Cannot read '" : "Cannot write '") + path +
                         "': " + std::generic_category().message(error_number)),
      step_(step) {}

}  // namespace vexel_yaml

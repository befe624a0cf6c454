#include "platform/error_dialog.h"

#ifdef __APPLE__
#include <CoreFoundation/CoreFoundation.h>
#endif

namespace vexel_yaml {

#ifdef __APPLE__

void ShowErrorDialog(const std::string& title, const std::string& text) {
  CFStringRef header = CFStringCreateWithCString(nullptr, title.c_str(), kCFStringEncodingUTF8);
  CFStringRef message = CFStringCreateWithCString(nullptr, text.c_str(), kCFStringEncodingUTF8);
  CFUserNotificationDisplayNotice(0, kCFUserNotificationStopAlertLevel, nullptr, nullptr, nullptr, header,
                                  message, nullptr);
  // Text that is no UTF-8 (a path of the user's) has no string object.
  if (header != nullptr) CFRelease(header);
  if (message != nullptr) CFRelease(message);
}

#else

void ShowErrorDialog(const std::string& /*title*/, const std::string& /*text*/) {}

#endif

}  // namespace vexel_yaml

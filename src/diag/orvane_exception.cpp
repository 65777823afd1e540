// Exception of the fatal path before the environment is ready and of library
// code that does not return statuses.
#include "diag/orvane_exception.h"

#include <cerrno>

orvaneException::orvaneException() : message_("generic orvane exception.\n"), errorNumber_(errno) {}

orvaneException::orvaneException(int line, const std::string& function, const std::string& file)
    : line_(line), function_(function), file_(file), errorNumber_(errno) {
  message_ = file + ": " + function + " (" + std::to_string(line) + "): exception found";
}

orvaneException::orvaneException(int line, const std::string& function, const std::string& file,
                                 const std::string& message)
    : message_(message), line_(line), function_(function), file_(file), errorNumber_(errno) {}

orvaneException::orvaneException(const std::string& message)
    : message_(message), line_(-1), function_("UNKNOWN FUNCTION"), file_("UNKNOWN FILE"),
      errorNumber_(errno) {}

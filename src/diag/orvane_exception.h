#pragma once
#include <string>

// Exception of the fatal path before the environment is ready, and of
// library code that does not return statuses. Thrown by value.
class orvaneException {
 public:
  orvaneException();
  orvaneException(int line, const std::string& function, const std::string& file);
  orvaneException(int line, const std::string& function, const std::string& file,
                  const std::string& message);
  explicit orvaneException(const std::string& message);

  const std::string& getMessage() const { return message_; }
  int getLine() const { return line_; }
  const std::string& getFunction() const { return function_; }
  const std::string& getFile() const { return file_; }
  int getErrorNumber() const { return errorNumber_; }

 private:
  std::string message_;
  int line_ = 0;
  std::string function_;
  std::string file_;
  int errorNumber_ = 0;
};

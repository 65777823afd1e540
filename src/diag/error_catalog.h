#pragma once
#include <string>
#include <vector>

// A catalogue of error or warning texts: primary groups, each with a title
// and one message per secondary number. A code is 65280 x primary + secondary.
struct CatalogueGroup {
  std::string key;    // the primary number as text
  std::string title;
  std::vector<std::string> messages;  // index: secondary number
};

class ErrorCatalogue {
 public:
  // Reads the layout: group count; the group keys; the group titles; then for
  // each group "ErrorCodeInfo_<key>", its message count and its messages.
  // On failure the catalogue stays unloaded and problem says why.
  bool load(const std::string& path, std::string& problem);
  void clear();
  bool loaded() const { return loaded_; }
  const std::vector<CatalogueGroup>& groups() const { return groups_; }

  // Title of the code's group and its message, or the generic texts of an
  // unknown code or of a catalogue not yet loaded.
  void lookup(int code, std::string& title, std::string& message) const;

 private:
  std::vector<CatalogueGroup> groups_;
  bool loaded_ = false;
};

constexpr int kErrorCodeBase = 65280;

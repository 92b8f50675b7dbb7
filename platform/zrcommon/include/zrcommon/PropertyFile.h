#pragma once

#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "zrcommon/File.h"

namespace ZR {

/// A file of lines KEY=value. Blanks around key and value do not count; one pair
/// of matching quotes around the value is taken off; "#" begins a comment line.
class PropertyFile {
  public:
    static constexpr int readMode = 1;  ///< the only mode there is

    explicit PropertyFile(File::Path path) : path_(std::move(path)) {}

    /// Reads the file. False when it cannot be read (it then has no keys), or the
    /// mode is not readMode.
    bool open(int mode);

    /// The value of a key: the last one, when several lines have the key; the
    /// empty text when none has.
    [[nodiscard]] std::wstring getValue(const std::wstring& key) const;

    /// Forgets what was read.
    void close() noexcept { values_.clear(); }

  private:
    File::Path path_;
    std::vector<std::pair<std::string, std::string>> values_;
};

/// One KEY=value pair of a property file, with the number of its line from 1.
struct PropertyLine {
    std::string key;
    std::string value;
    unsigned line = 0;

    bool operator==(const PropertyLine&) const = default;
};

/// The pairs of a property file's text, in their order; lines that are neither a
/// pair, a comment nor blank are handed out whole, with an empty key.
[[nodiscard]] std::vector<PropertyLine> parsePropertyLines(std::string_view text);

}  // namespace ZR

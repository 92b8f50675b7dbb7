#include "cimom/Registrations.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <optional>
#include <sstream>
#include <utility>

#include "cimom/Names.h"

namespace cimom {

namespace {

constexpr std::string_view blanks = " \t\r\v\f";

/// In which process a provider runs, as whom and how long. All providers run in this one
/// here, and none has parameters.
constexpr std::array<std::string_view, 4> processKeys{"group", "unload", "parameters", "user"};

std::string_view trimmed(std::string_view text) noexcept {
    const std::size_t first = text.find_first_not_of(blanks);
    if (first == std::string_view::npos) {
        return {};
    }
    return text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

bool isName(std::string_view text) noexcept {
    return !text.empty() && isNameStart(text.front()) && std::ranges::all_of(text, isNamePart);
}

/// Reads line by line; a section ends with the next one or with the file.
class RegistrationReader {
  public:
    explicit RegistrationReader(std::filesystem::path file) : file_(std::move(file)) {}

    std::vector<Registration> read() {
        std::ifstream stream(file_);
        if (!stream) {
            throw LoadError(file_.string() + ": " + std::strerror(errno));
        }
        std::string line;
        while (std::getline(stream, line)) {
            ++line_;
            // A comment goes from "#" to the end of the line: no name has that sign.
            const std::string_view text = trimmed(std::string_view(line).substr(0, line.find('#')));
            if (text.empty()) {
                continue;
            }
            if (text.front() == '[') {
                beginSection(text);
            } else if (!current_ && text.find(':') == std::string_view::npos) {
                readColumns(text);
            } else {
                readEntry(text);
            }
        }
        if (stream.bad()) {
            throw LoadError(file_.string() + ": " + std::strerror(errno));
        }
        endSection();
        return std::move(registrations_);
    }

  private:
    [[noreturn]] void fail(std::size_t line, const std::string& reason) const {
        throw LoadError(file_.string() + ":" + std::to_string(line) + ": " + reason);
    }

    /// A class in one line: class, namespace, provider, location and its types.
    void readColumns(std::string_view text) {
        std::istringstream words{std::string(text)};
        std::string className;
        std::string nameSpace;
        std::string provider;
        std::string location;
        if (!(words >> className >> nameSpace >> provider >> location) || !(words >> std::ws) ||
            words.eof() || !isName(className)) {
            // Not with operator+, in which g++ 12 sees a copy that is too long.
            fail(line_, std::string("\"").append(text) +
                            "\" is neither [CLASS] nor a line of the form "
                            "CLASS NAMESPACE PROVIDER LOCATION TYPE...");
        }
        current_.emplace();
        current_->className = className;
        typeGiven_ = false;
        readNameSpaces(nameSpace);
        set(current_->provider, "provider", provider);
        set(current_->location, "location", location);
        std::string types;
        std::getline(words, types);
        readTypes(types);
        endSection();
    }

    void beginSection(std::string_view text) {
        endSection();
        const std::string_view name =
            text.back() == ']' ? trimmed(text.substr(1, text.size() - 2)) : std::string_view();
        if (!isName(name)) {
            fail(line_, "a section begins with [CLASS], not with \"" + std::string(text) + "\"");
        }
        current_.emplace();
        current_->className = name;
        typeGiven_ = false;
        sectionLine_ = line_;
    }

    void endSection() {
        if (!current_) {
            return;
        }
        const std::string section = "[" + current_->className + "] has no line \"";
        if (current_->provider.empty()) {
            fail(sectionLine_, section + "provider:\"");
        }
        if (current_->location.empty()) {
            fail(sectionLine_, section + "location:\"");
        }
        if (!typeGiven_) {
            fail(sectionLine_, section + "type:\"");
        }
        if (current_->nameSpaces.empty()) {
            fail(sectionLine_, section + "namespace:\"");
        }
        registrations_.push_back(std::move(*current_));
        current_.reset();
    }

    void readEntry(std::string_view text) {
        const std::size_t colon = text.find(':');
        if (colon == std::string_view::npos) {
            fail(line_, "\"" + std::string(text) + "\" is not a line of the form KEY: VALUE");
        }
        if (!current_) {
            fail(line_, "the line stands before the first [CLASS]");
        }
        const std::string_view key = trimmed(text.substr(0, colon));
        const std::string_view value = trimmed(text.substr(colon + 1));
        if (std::ranges::any_of(processKeys,
                                [key](std::string_view each) { return sameName(key, each); })) {
            return;
        }
        if (value.empty()) {
            fail(line_, "\"" + std::string(key) + ":\" has no value");
        }
        if (sameName(key, "provider")) {
            set(current_->provider, key, value);
        } else if (sameName(key, "location")) {
            set(current_->location, key, value);
        } else if (sameName(key, "type")) {
            readTypes(value);
        } else if (sameName(key, "namespace")) {
            readNameSpaces(value);
        } else {
            fail(line_, "\"" + std::string(key) + ":\" is unknown");
        }
    }

    void once(bool given, std::string_view key) const {
        if (given) {
            fail(line_, "\"" + std::string(key) + ":\" is given twice");
        }
    }

    void set(std::string& member, std::string_view key, std::string_view value) const {
        once(!member.empty(), key);
        if (value.find_first_of(blanks) != std::string_view::npos ||
            value.find('/') != std::string_view::npos) {
            fail(line_, "\"" + std::string(value) + "\" is not a name for \"" + std::string(key) +
                            R"(:": blanks and "/" cannot be in it)");
        }
        member = value;
    }

    void readTypes(std::string_view value) {
        once(typeGiven_, "type");
        typeGiven_ = true;
        std::istringstream words{std::string(value)};
        for (std::string word; words >> word;) {
            if (sameName(word, "instance")) {
                current_->instance = true;
            } else if (sameName(word, "association")) {
                current_->association = true;
            } else if (sameName(word, "indication")) {
                current_->indication = true;
            } else if (!sameName(word, "method") && !sameName(word, "property")) {
                // Those two are kinds that other object managers serve.
                fail(line_, "\"" + word + "\" is not a type of provider");
            }
        }
    }

    void readNameSpaces(std::string_view value) {
        once(!current_->nameSpaces.empty(), "namespace");
        std::istringstream words{std::string(value)};
        for (std::string word; words >> word;) {
            word.erase(0, word.find_first_not_of('/'));
            word.erase(word.find_last_not_of('/') + 1);
            if (word.empty()) {
                fail(line_, "\"/\" is not a namespace");
            }
            current_->nameSpaces.push_back(std::move(word));
        }
    }

    std::filesystem::path file_;
    std::size_t line_ = 0;
    std::size_t sectionLine_ = 0;
    std::optional<Registration> current_;
    bool typeGiven_ = false;
    std::vector<Registration> registrations_;
};

}  // namespace

std::vector<Registration> readRegistrations(const std::filesystem::path& file) {
    return RegistrationReader(file).read();
}

}  // namespace cimom

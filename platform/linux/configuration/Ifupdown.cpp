#include "configuration/ConfigurationFiles.h"

#include <fnmatch.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <map>

#include "formats/Files.h"
#include "formats/Trust.h"
#include "zrcommon/Strings.h"

namespace ZR::Live {
namespace {

// Files that include each other end here.
constexpr int deepest = 10;

/// Takes one line off a text, together with those that a "\" at the end adds.
std::string takeLine(std::string_view& text) {
    std::string line;
    for (bool more = true; more && !text.empty();) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        std::string_view part = text.substr(0, end);
        text.remove_prefix(std::min(end + 1, text.size()));
        more = part.ends_with('\\');
        if (more) {
            part.remove_suffix(1);
        }
        line += part;
    }
    return line;
}

void takeOption(std::string_view keyword, std::string_view rest, IfaceStanza& stanza) {
    if (keyword == "address" && stanza.family == "inet") {
        if (const auto address = IpAddress::ipv4FromText(trim(rest))) {
            stanza.addresses.push_back(*address);
        }
    } else if (keyword == "dhcp") {
        stanza.dhcp = trim(rest) == "1" || trim(rest) == "yes";
    }
}

/// Whether a stanza begins that is not one of an interface; it ends the one before it.
bool beginsStanza(std::string_view keyword) {
    constexpr std::array<std::string_view, 6> keywords{"auto",       "mapping", "no-auto-down",
                                                       "no-scripts", "rename",  "template"};
    return std::find(keywords.begin(), keywords.end(), keyword) != keywords.end() ||
           keyword.starts_with("allow-");
}

struct Found {
    IfaceStanza stanza;
    std::string file;
};

/// Reads a file and those that it includes.
class Reader {
  public:
    Reader(const Roots& roots, ClientFacts& facts) : roots_(roots), facts_(facts) {}

    void readFile(const std::string& path, int depth) {
        const auto text = readOptionalFile(roots_.path(path), facts_.diagnostics);
        if (!text || depth == deepest) {
            return;
        }
        InterfacesFile file = parseInterfaces(*text);
        for (IfaceStanza& stanza : file.stanzas) {
            found_.push_back({.stanza = std::move(stanza), .file = roots_.path(path)});
        }
        const std::string directory = path.substr(0, path.rfind('/'));
        for (const std::string& pattern : file.sources) {
            const std::string whole = absolute(pattern, directory);
            const std::size_t slash = whole.rfind('/');
            readMatching(whole.substr(0, slash), whole.substr(slash + 1), depth);
        }
        for (const std::string& further : file.directories) {
            readMatching(absolute(further, directory), "*", depth);
        }
    }

    [[nodiscard]] const std::vector<Found>& found() const { return found_; }

  private:
    static std::string absolute(const std::string& path, const std::string& directory) {
        return path.starts_with('/') ? path : pathIn(directory, path);
    }

    void readMatching(const std::string& directory, const std::string& pattern, int depth) {
        const std::string place = roots_.path(directory);
        facts_.places.push_back(
            {.directory = place, .namePrefix = pattern.substr(0, pattern.find_first_of("*?[\\"))});
        for (const std::string& name : listOptionalDirectory(place, facts_.diagnostics)) {
            if (::fnmatch(pattern.c_str(), name.c_str(), FNM_PERIOD) == 0) {
                readFile(pathIn(directory, name), depth + 1);
            }
        }
    }

    const Roots& roots_;
    ClientFacts& facts_;
    std::vector<Found> found_;
};

/// Several stanzas of one interface add up.
void apply(const IfaceStanza& stanza, LinkConfiguration& configuration) {
    const std::string& method = stanza.method;
    if (stanza.family == "inet6") {
        if (method == "dhcp" || (method == "auto" && stanza.dhcp)) {
            configuration.dhcp6 = true;
        }
        return;
    }
    if (stanza.family != "inet") {
        return;
    }
    if (method == "dhcp") {
        configuration.dhcp4 = true;
        return;
    }
    const bool other = method == "ppp" || method == "wvdial" || method == "tunnel";
    if (method != "static" && method != "bootp" && method != "ipv4ll" && !other) {
        return;  // "manual", "loopback", and unknown methods
    }
    configuration.dhcp4 = configuration.dhcp4.value_or(false);
    configuration.bootp4 = configuration.bootp4 || method == "bootp";
    configuration.linkLocal4 = configuration.linkLocal4 || method == "ipv4ll";
    configuration.other4 = configuration.other4 || other;
    if (method == "static") {
        configuration.staticAddresses.insert(configuration.staticAddresses.end(),
                                             stanza.addresses.begin(), stanza.addresses.end());
    }
}

}  // namespace

InterfacesFile parseInterfaces(std::string_view text) {
    InterfacesFile file;
    bool inStanza = false;
    while (!text.empty()) {
        const std::string whole = takeLine(text);
        std::string_view line = trim(whole);
        if (line.empty() || line.starts_with('#')) {
            continue;
        }
        const std::string_view keyword = nextWord(line);
        if (keyword == "iface") {
            IfaceStanza stanza;
            stanza.name = nextWord(line);
            stanza.family = nextWord(line);
            stanza.method = nextWord(line);
            inStanza = true;
            file.stanzas.push_back(std::move(stanza));
        } else if (keyword == "source" || keyword == "source-directory") {
            inStanza = false;
            auto& further = keyword == "source" ? file.sources : file.directories;
            if (const std::string_view path = trim(line); !path.empty()) {
                further.emplace_back(path);
            }
        } else if (beginsStanza(keyword)) {
            inStanza = false;
        } else if (inStanza) {
            takeOption(keyword, line, file.stanzas.back());
        }
    }
    return file;
}

std::vector<std::pair<InterfaceName, std::string>> parseIfstate(std::string_view text) {
    std::vector<std::pair<InterfaceName, std::string>> up;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        const std::string_view line = trim(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
        const std::size_t equals = line.find('=');
        const auto name = InterfaceName::from(line.substr(0, equals));
        if (equals != std::string_view::npos && name) {
            up.emplace_back(*name, line.substr(equals + 1));
        }
    }
    return up;
}

void readIfupdown(const Roots& roots, ClientFacts& facts) {
    Reader reader{roots, facts};
    reader.readFile(std::string{ifupdownDirectory} + '/' + std::string{ifupdownFile}, 0);
    const auto state = readTrustedFile(
        pathIn(roots.path(ifupdownStateDirectory), ifupdownStateFile), {}, facts.diagnostics);
    const auto up = parseIfstate(state.value_or(""));
    std::map<InterfaceName, LinkConfiguration> byInterface;
    const auto applyTo = [&](const InterfaceName& interface,
                             const Found& found) -> LinkConfiguration& {
        const LinkConfiguration empty{.client = Client::Ifupdown,
                                      .interfaceName = interface,
                                      .dhcp4 = {},
                                      .dhcp6 = {},
                                      .staticAddresses = {},
                                      .origin = found.file};
        LinkConfiguration& configuration = byInterface.emplace(interface, empty).first->second;
        apply(found.stanza, configuration);
        return configuration;
    };
    for (const Found& found : reader.found()) {
        bool mapped = false;
        for (const auto& [physical, logical] : up) {
            if (logical == found.stanza.name) {
                mapped = true;
                applyTo(physical, found).applied = true;
            }
        }
        const auto name = InterfaceName::from(found.stanza.name);
        if (!mapped && name) {
            static_cast<void>(applyTo(*name, found));
        }
    }
    for (auto& [interface, configuration] : byInterface) {
        if (configuration.dhcp4 || configuration.dhcp6) {
            facts.configurations.push_back(std::move(configuration));
        }
    }
}

}  // namespace ZR::Live

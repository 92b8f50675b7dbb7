#include "arguments/UnfinishedLine.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <array>
#include <string_view>
#include <utility>

namespace cimdhcp {

namespace {

using Wanted = UnfinishedLine::Wanted;

/// What the names of arguments and of options' values stand for.
struct Placeholder {
    std::string_view name;
    Wanted wanted;
};
constexpr std::array<Placeholder, 12> placeholders{{{"FILE", Wanted::file},
                                                    {"PATH", Wanted::path},
                                                    {"DIR", Wanted::directory},
                                                    {"URL", Wanted::host},
                                                    {"NS", Wanted::nameSpace},
                                                    {"CLASS", Wanted::className},
                                                    {"INTERFACE", Wanted::interface},
                                                    {"PROPERTY=VALUE", Wanted::assignment},
                                                    {"COLUMN", Wanted::column},
                                                    {"COLUMN,...", Wanted::column},
                                                    {"PROPERTY,...", Wanted::property},
                                                    {"PROPERTY", Wanted::role}}};

/// Where the placeholder says too little.
constexpr std::array<Placeholder, 3> particularOptions{
    {{"--tree", Wanted::treeFile},
     {"--cim-schema", Wanted::file},
     {"--assoc-class", Wanted::associationClass}}};

/// The options that say which machine is asked, and how. Of many servers none is.
constexpr std::array<std::string_view, 13> keptOptions{
    "--tree",       "--data-dir", "--namespace",   "--connect",    "--credentials",
    "--cacert",     "--insecure", "--timeout",     "--schema-dir", "--registration-dir",
    "--cim-schema", "--exact",    "--provider-dir"};

template <typename Table>
Wanted wantedBy(const Table& table, std::string_view name) {
    const auto* const found = std::find_if(
        table.begin(), table.end(), [name](const Placeholder& each) { return each.name == name; });
    return found == table.end() ? Wanted::nothing : found->wanted;
}

/// The first words of a help text: up to its first full stop or semicolon.
std::string shortMeaning(const std::string& text) {
    return text.substr(0, text.find_first_of("\n;."));
}

std::vector<PossibleWord> subcommandsOf(const CLI::App& app) {
    std::vector<PossibleWord> words;
    for (const CLI::App* const each :
         app.get_subcommands([](const CLI::App* /*all*/) { return true; })) {
        words.push_back({each->get_name(), shortMeaning(each->get_description())});
    }
    return words;
}

const CLI::App* subcommandNamed(const CLI::App& app, const std::string& name) {
    const auto commands =
        app.get_subcommands([&name](const CLI::App* each) { return each->get_name() == name; });
    return commands.empty() ? nullptr : commands.front();
}

void addOptionWords(const CLI::App& app, std::vector<PossibleWord>& words) {
    for (const CLI::Option* const option : app.get_options()) {
        for (const std::string& name : option->get_lnames()) {
            const std::string word = "--" + name;
            const bool known = std::any_of(words.begin(), words.end(),
                                           [&word](const auto& each) { return each.word == word; });
            if (!known) {
                words.push_back({word, shortMeaning(option->get_description())});
            }
        }
    }
}

const CLI::Option* positionalAt(const CLI::App& app, std::size_t place) {
    const CLI::Option* last = nullptr;
    for (const CLI::Option* const option : app.get_options()) {
        if (!option->get_positional()) {
            continue;
        }
        last = option;
        const bool several = option->get_expected_max() > 1;
        if (several || place == 0) {
            return last;
        }
        --place;
    }
    return nullptr;
}

/// Follows the words up to the last one.
class Walk {
  public:
    explicit Walk(const CLI::App& app) : program_(app), app_(&app) {}

    void pass(const std::string& word) {
        if (pending_ != nullptr) {
            keep(word);
            pending_ = nullptr;
        } else if (!operandsOnly_ && word == "--") {
            operandsOnly_ = true;
        } else if (!operandsOnly_ && word.starts_with('-') && word.size() > 1) {
            passOption(word);
        } else if (const CLI::App* const command = commandNamed(word)) {
            app_ = command;
            line_.command += (line_.command.empty() ? "" : " ") + word;
        } else {
            line_.operands.push_back(word);
        }
    }

    UnfinishedLine end(const std::string& word) {
        line_.begun = word;
        if (pending_ != nullptr) {
            valueOf(*pending_);
        } else if (!operandsOnly_ && word.starts_with('-')) {
            endInOption(word);
        } else {
            endInOperand();
        }
        return std::move(line_);
    }

  private:
    [[nodiscard]] const CLI::Option* optionNamed(const std::string& name) const {
        const CLI::Option* const own = app_->get_option_no_throw(name);
        return own != nullptr ? own : program_.get_option_no_throw(name);
    }

    [[nodiscard]] const CLI::App* commandNamed(const std::string& word) const {
        if (operandsOnly_ || !line_.operands.empty()) {
            return nullptr;
        }
        return subcommandNamed(*app_, word);
    }

    void keep(const std::string& word) {
        if (kept_) {
            line_.optionWords.push_back(word);
        }
    }

    void passOption(const std::string& word) {
        const std::size_t sign = word.find('=');
        const std::string name = word.substr(0, sign);
        const CLI::Option* const option = optionNamed(name);
        kept_ = std::find(keptOptions.begin(), keptOptions.end(), name) != keptOptions.end();
        keep(word);
        if (option != nullptr && option->get_items_expected_max() > 0 &&
            sign == std::string::npos) {
            pending_ = option;
        }
    }

    void endInOption(const std::string& word) {
        const std::size_t sign = word.find('=');
        if (sign == std::string::npos) {
            line_.wanted = Wanted::words;
            addOptionWords(program_, line_.words);
            if (app_ != &program_) {
                addOptionWords(*app_, line_.words);
            }
            return;
        }
        line_.fixed = word.substr(0, sign + 1);
        line_.begun = word.substr(sign + 1);
        if (const CLI::Option* const option = optionNamed(word.substr(0, sign))) {
            valueOf(*option);
        }
    }

    void valueOf(const CLI::Option& option) {
        const std::string name = option.get_lnames().empty() ? "" : "--" + option.get_lnames()[0];
        const std::string type = option.get_type_name();
        line_.wanted = wantedBy(particularOptions, name);
        if (line_.wanted == Wanted::nothing) {
            line_.wanted = wantedBy(placeholders, type);
        }
        if (type == "FORMAT") {
            choose({{"table", "for people"},
                    {"tsv", "values with tabs between them"},
                    {"mof", "instance declarations"},
                    {"json", "for programs"}});
        } else if (type == "WHEN") {
            choose({{"auto", "on a terminal"}, {"always", ""}, {"never", ""}});
        } else if (type.ends_with(",...")) {
            const std::size_t comma = line_.begun.rfind(',');
            const std::size_t length = comma == std::string::npos ? 0 : comma + 1;
            line_.fixed += line_.begun.substr(0, length);
            line_.begun.erase(0, length);
        }
    }

    void choose(std::vector<PossibleWord> words) {
        line_.wanted = Wanted::words;
        line_.words = std::move(words);
    }

    void endInOperand() {
        if (line_.command == "help") {
            choose(subcommandsOf(helped()));
            return;
        }
        if (line_.operands.empty() && !subcommandsOf(*app_).empty()) {
            choose(subcommandsOf(*app_));
            return;
        }
        if (const CLI::Option* const operand = positionalAt(*app_, line_.operands.size())) {
            line_.wanted = wantedBy(placeholders, operand->get_name(true));
        }
    }

    /// The command whose commands are explained.
    [[nodiscard]] const CLI::App& helped() const {
        const CLI::App* app = &program_;
        for (const std::string& word : line_.operands) {
            const CLI::App* const next = subcommandNamed(*app, word);
            app = next == nullptr ? app_ : next;
        }
        return *app;
    }

    const CLI::App& program_;
    const CLI::App* app_;
    const CLI::Option* pending_ = nullptr;  ///< whose value is next
    bool kept_ = false;                     ///< the option passed last is
    bool operandsOnly_ = false;
    UnfinishedLine line_;
};

}  // namespace

UnfinishedLine whatIsUnfinished(const CLI::App& app, const std::vector<std::string>& words) {
    Walk walk(app);
    for (std::size_t index = 0; index + 1 < words.size(); ++index) {
        walk.pass(words[index]);
    }
    return walk.end(words.empty() ? std::string() : words.back());
}

}  // namespace cimdhcp

#pragma once

#include <CLI/CLI.hpp>
#include <sstream>
#include <string>
#include <utility>

namespace cimdhcp {

/// Lays the help out for a reader: the commands, each with its arguments, stand
/// before the options, which show their argument and no more.
///
/// Without a source file of its own: the parser's header is slow to compile, and the
/// command line is the one place that needs this.
class HelpFormatter : public CLI::Formatter {
  public:
    HelpFormatter() {
        column_width(columnWidth);
        label("Positionals", "Arguments");
    }

    [[nodiscard]] std::string make_help(const CLI::App* app, std::string name,
                                        CLI::AppFormatMode mode) const override {
        // Groups bring a blank line each, and one more between two of them.
        const std::string options =
            CLI::detail::find_and_replace(make_groups(app, mode), "\n\n\n", "\n\n");
        const std::string footer = make_footer(app);
        return make_usage(app, std::move(name)) + '\n' + make_description(app) +
               make_positionals(app) + make_subcommands(app, mode) + options +
               (footer.empty() ? "" : "\n") + footer;
    }

    [[nodiscard]] std::string make_usage(const CLI::App* app, std::string name) const override {
        const bool main = app->get_parent() == nullptr;
        return "Usage: " + name + (main ? " [OPTIONS] COMMAND" : " [OPTIONS]" + arguments(app)) +
               '\n';
    }

    [[nodiscard]] std::string make_subcommand(const CLI::App* sub) const override {
        std::ostringstream out;
        CLI::detail::format_help(out, sub->get_name() + arguments(sub), sub->get_description(),
                                 columnWidth);
        return out.str();
    }

    [[nodiscard]] std::string make_option_opts(const CLI::Option* option) const override {
        const std::string type = option->get_positional() ? "" : option->get_type_name();
        return type.empty() ? std::string() : ' ' + type;
    }

  private:
    static constexpr std::size_t columnWidth = 34;

    /// " INTERFACE NAME": what stands behind a command.
    static std::string arguments(const CLI::App* app) {
        std::string text;
        for (const CLI::Option* const option : app->get_options()) {
            if (option->get_positional()) {
                const bool several = option->get_expected_max() > 1;
                const std::string one = option->get_name(true) + (several ? "..." : "");
                text += ' ' + (option->get_required() ? one : '[' + one + ']');
            }
        }
        return text;
    }
};

}  // namespace cimdhcp

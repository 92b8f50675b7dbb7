#pragma once

#include <CLI/CLI.hpp>
#include <string>

namespace cimdhcp {

/// Lays the help out for a reader: the commands, each with its arguments, stand
/// before the options, which show their argument and no more.
class HelpFormatter : public CLI::Formatter {
  public:
    HelpFormatter();

    [[nodiscard]] std::string make_help(const CLI::App* app, std::string name,
                                        CLI::AppFormatMode mode) const override;
    [[nodiscard]] std::string make_usage(const CLI::App* app, std::string name) const override;
    [[nodiscard]] std::string make_subcommand(const CLI::App* sub) const override;
    [[nodiscard]] std::string make_option_opts(const CLI::Option* option) const override;
};

}  // namespace cimdhcp

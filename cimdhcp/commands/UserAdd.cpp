#include "commands/Serve.h"

#include <termios.h>
#include <unistd.h>

#include <iostream>
#include <stdexcept>
#include <string>

#include "text/DisplayText.h"
#include "text/Failure.h"
#include "wbem/Users.h"

namespace cimdhcp {

namespace {

/// Switches the echo of the terminal at standard input off.
class WithoutEcho {
  public:
    WithoutEcho() : changed_(::tcgetattr(STDIN_FILENO, &before_) == 0) {
        if (changed_) {
            termios without = before_;
            without.c_lflag &= ~static_cast<tcflag_t>(ECHO);
            changed_ = ::tcsetattr(STDIN_FILENO, TCSAFLUSH, &without) == 0;
        }
    }
    ~WithoutEcho() {
        if (changed_) {
            // A terminal that has gone needs no echo.
            static_cast<void>(::tcsetattr(STDIN_FILENO, TCSAFLUSH, &before_));
        }
    }
    WithoutEcho(const WithoutEcho&) = delete;
    WithoutEcho& operator=(const WithoutEcho&) = delete;

  private:
    termios before_{};
    bool changed_;
};

std::string readLine() {
    std::string line;
    std::getline(std::cin, line);
    return line;
}

std::string askPassword(const std::string& name, std::ostream& prompts) {
    if (::isatty(STDIN_FILENO) == 0) {
        return readLine();
    }
    const WithoutEcho withoutEcho;
    prompts << "Password of " << name << ": " << std::flush;
    std::string password = readLine();
    prompts << "\nAgain: " << std::flush;
    const bool same = readLine() == password;
    prompts << '\n';
    if (!same) {
        throw Failure(ExitStatus::notDone, "the two passwords differ");
    }
    return password;
}

}  // namespace

void addUser(const UserAddCommand& command, std::ostream& out, std::ostream& prompts) {
    if (!cimom::wbem::isUserName(command.name)) {
        throw Failure(ExitStatus::usage,
                      "\"" + printable(command.name) +
                          "\" is not a user name: letters, digits, \".\", \"-\", "
                          "\"_\" and \"@\", at most 64");
    }
    try {
        cimom::wbem::User user;
        user.name = command.name;
        user.role = command.mayModify ? cimom::wbem::Role::modify : cimom::wbem::Role::read;
        user.hash = cimom::wbem::hashPassword(askPassword(command.name, prompts));
        cimom::wbem::putUser(command.users, user);
        out << "User " << user.name << " (" << cimom::wbem::roleName(user.role) << ") is in "
            << command.users << ".\n";
    } catch (const std::invalid_argument& error) {
        throw Failure(ExitStatus::usage, error.what());
    } catch (const cimom::wbem::UsersError& error) {
        throw Failure(ExitStatus::notLoaded, printable(error.what()));
    }
}

}  // namespace cimdhcp

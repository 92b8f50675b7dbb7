#include "commands/Complete.h"

#include <algorithm>
#include <exception>
#include <optional>
#include <utility>
#include <vector>

#include "cimom/ClassDeclaration.h"
#include "cimom/ObjectPath.h"
#include "cimom/ObjectPathText.h"
#include "client/Client.h"
#include "client/MachineInterfaces.h"
#include "commands/Overview.h"
#include "commands/Profiles.h"
#include "commands/classes/CimOperations.h"
#include "commands/classes/ClassTable.h"
#include "text/ValueMeaning.h"

namespace cimdhcp {

namespace {

using Wanted = UnfinishedLine::Wanted;

/// "CONFIGURATION NAME" as an option takes it: "configuration-name".
std::string optionForm(std::string heading) {
    std::transform(heading.begin(), heading.end(), heading.begin(), [](char letter) {
        return letter == ' '                    ? '-'
               : letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a')
                                                : letter;
    });
    return heading;
}

std::vector<std::string> plainColumns(const UnfinishedLine& line, std::int64_t now) {
    if (line.command == "show") {
        return headingsOf(overviewColumns(now));
    }
    if (line.command == "classes") {
        return headingsOf(classColumns());
    }
    if (line.command == "profiles") {
        return headingsOf(profileColumns());
    }
    if (line.command == "describe") {
        const cimom::ClassDeclaration any;
        return headingsOf(propertyColumns(any));
    }
    return {};
}

/// The class of a path that may be unfinished: what stands before the first dot, without
/// namespace.
std::string classOf(const std::string& path) {
    std::string name = path.substr(0, path.find('.'));
    const std::size_t colon = name.rfind(':');
    return colon == std::string::npos ? name : name.substr(colon + 1);
}

class Completer {
  public:
    Completer(const UnfinishedLine& line, const WithClient& withClient, std::int64_t now)
        : line_(line), withClient_(withClient), now_(now) {}

    std::string text() {
        switch (line_.wanted) {
            case Wanted::nothing:
                break;
            case Wanted::words:
                for (const PossibleWord& each : line_.words) {
                    add(each.word, each.meaning);
                }
                break;
            case Wanted::file:
                return ":file\n";
            case Wanted::treeFile:
                return ":tree\n";
            case Wanted::directory:
                return ":directory\n";
            case Wanted::host:
                return ":host\n";
            case Wanted::nameSpace:
                add("root/cimv2", "");
                add("root/interop", "");
                break;
            default:
                askClient();
        }
        return (goesOn_ ? ":nospace\n" : "") + text_;
    }

  private:
    void add(const std::string& word, const std::string& meaning) {
        // A word that has a line feed cannot be typed.
        if (word.starts_with(line_.begun) && word.find_first_of("\n\t") == std::string::npos) {
            text_ += line_.fixed + word + (meaning.empty() ? "" : '\t' + meaning) + '\n';
        }
    }

    void askClient() {
        const auto columns = plainColumns(line_, now_);
        if (line_.wanted == Wanted::column && !columns.empty()) {
            for (const std::string& each : columns) {
                add(optionForm(each), "");
            }
            return;
        }
        try {
            withClient_([this](Client& client) { ask(client); });
        } catch (const std::exception&) {
            // A line that is still typed is no place for messages.
        }
    }

    void ask(Client& client) {
        switch (line_.wanted) {
            case Wanted::className:
            case Wanted::associationClass:
                addClasses(client, line_.wanted == Wanted::associationClass);
                break;
            case Wanted::path:
                addPaths(client);
                break;
            case Wanted::interface:
                addInterfaces(client);
                break;
            case Wanted::assignment:
                addAssignments(client);
                break;
            case Wanted::column:
                add("PATH", "");
                addProperties(client);
                break;
            case Wanted::property:
                addProperties(client);
                break;
            case Wanted::role:
                addRoles(client);
                break;
            default:
                break;
        }
    }

    void addClasses(Client& client, bool associationsOnly) {
        for (const ClassEntry& entry : client.servedClasses()) {
            if (entry.association || !associationsOnly) {
                add(entry.name, entry.superclass);
            }
        }
    }

    /// First the class, then the instances of it.
    void addPaths(Client& client) {
        const std::size_t quote = std::min(line_.begun.find('"'), line_.begun.size());
        const std::size_t colon = line_.begun.substr(0, quote).rfind(':');
        const std::string nameSpace =
            colon == std::string::npos ? "" : line_.begun.substr(0, colon);
        const std::string before = nameSpace.empty() ? "" : nameSpace + ':';
        std::string className = classOf(line_.begun);
        if (line_.begun.find('.') == std::string::npos) {
            std::vector<std::string> found;
            for (const ClassEntry& entry : client.servedClasses()) {
                if (entry.name.starts_with(className)) {
                    found.push_back(entry.name);
                }
            }
            if (found.size() != 1) {
                for (const std::string& each : found) {
                    add(before + each + '.', "");
                }
                goesOn_ = true;
                return;
            }
            className = found.front();
        }
        cimom::ObjectPath path = client.classPath(className);
        path.nameSpace = nameSpace.empty() ? path.nameSpace : nameSpace;
        for (const auto& each : client.enumerateNames(path).paths) {
            if (each) {
                cimom::ObjectPath shown = *each;
                shown.nameSpace.clear();
                add(before + cimom::toText(shown), "");
            }
        }
    }

    void addInterfaces(Client& client) {
        for (const cimom::ObjectPath& path : client.pathsIn(settingClass)) {
            if (const auto id = readInterfaceId(heldText(path.key("InstanceID")))) {
                const bool given = std::find(line_.operands.begin(), line_.operands.end(),
                                             id->name) != line_.operands.end();
                if (!given) {
                    add(id->name, "");
                }
            }
        }
    }

    const cimom::ClassDeclaration* askedClass(Client& client) const {
        return line_.operands.empty() ? nullptr
                                      : client.classes().find(classOf(line_.operands.front()));
    }

    void addAssignments(Client& client) {
        goesOn_ = true;
        if (const cimom::ClassDeclaration* const declaration = askedClass(client)) {
            for (const cimom::PropertyDeclaration& each : declaration->properties) {
                if (mayBeWritten(*declaration, each)) {
                    add(each.name + '=', "");
                }
            }
        }
    }

    void addProperties(Client& client) {
        if (const cimom::ClassDeclaration* const declaration = askedClass(client)) {
            for (const cimom::PropertyDeclaration& each : declaration->properties) {
                add(each.name, "");
            }
        }
    }

    void addRoles(Client& client) {
        for (const std::string& role : rolesOf(std::nullopt, client)) {
            add(role, "");
        }
    }

    const UnfinishedLine& line_;
    const WithClient& withClient_;
    std::int64_t now_;
    std::string text_;
    bool goesOn_ = false;
};

}  // namespace

std::string completionText(const UnfinishedLine& line, const WithClient& withClient,
                           std::int64_t now) {
    return Completer(line, withClient, now).text();
}

}  // namespace cimdhcp

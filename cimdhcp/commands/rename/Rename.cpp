#include "commands/rename/Rename.h"

#include <algorithm>
#include <cstddef>
#include <utility>
#include <vector>

#include "cimom/Instance.h"
#include "client/Client.h"
#include "client/MachineInterfaces.h"
#include "client/Response.h"
#include "commands/Detail.h"
#include "commands/classes/CimOperations.h"
#include "commands/rename/RenameFiles.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/JsonText.h"
#include "text/ValueMeaning.h"
#include "zrcommon/File.h"
#include "zrcommon/InterfaceFile.h"
#include "zrcommon/Strings.h"

namespace cimdhcp {

namespace {

/// The setting of one interface.
struct Setting {
    cimom::ObjectPath path;
    std::string id;             ///< "Computer%eth0"
    std::string interfaceName;  ///< "eth0"
};

std::vector<Setting> settings(Client& client) {
    std::vector<Setting> result;
    for (cimom::ObjectPath& path : client.pathsIn(settingClass)) {
        std::string text = heldText(path.key("InstanceID"));
        if (auto id = readInterfaceId(text)) {
            result.push_back({std::move(path), std::move(text), std::move(id->name)});
        }
    }
    return result;
}

std::string list(const std::vector<Setting>& settings, std::string Setting::*member) {
    std::string text;
    for (const Setting& setting : settings) {
        text += (text.empty() ? "" : ", ") + printable(setting.*member);
    }
    return text;
}

Setting find(const std::string& wanted, const std::vector<Setting>& all) {
    std::vector<Setting> found;
    for (const Setting& setting : all) {
        if (setting.id == wanted) {
            return setting;
        }
        if (setting.interfaceName == wanted) {
            found.push_back(setting);
        }
    }
    if (found.empty()) {
        std::vector<std::string> known;
        known.reserve(all.size());
        for (const Setting& setting : all) {
            known.push_back(setting.interfaceName);
        }
        refuseInterface(wanted, known);
    }
    if (found.size() > 1) {
        throw Failure(ExitStatus::notDone, "there are several interfaces \"" + printable(wanted) +
                                               "\"; name one of: " + list(found, &Setting::id));
    }
    return found.front();
}

std::string nameNow(const cimom::ObjectPath& path, Client& client) {
    const Response response = client.get(path);
    if (!response.status.ok()) {
        throw client.failure(response, path);
    }
    for (const auto& instance : response.instances) {
        if (instance) {
            return heldText(instance->property(nameProperty));
        }
    }
    return {};
}

/// The line of a name, cut where it is longer than a person reads.
std::string nameLineOf(const std::string& name) {
    constexpr std::size_t longest = 60;
    return std::string(ZR::InterfaceFile::configurationName) + '=' +
           printable(name.substr(0, longest)) + (name.size() > longest ? "..." : "");
}

/// Throws what speaks against a rename, unless it is forced.
void refuse(const std::vector<std::string>& refusals, const std::string& about,
            const RenameCommand& command) {
    constexpr std::size_t mostTold = 4;
    if (refusals.empty() || command.force) {
        return;
    }
    std::string text;
    for (std::size_t i = 0; i < std::min(refusals.size(), mostTold); ++i) {
        text += (i == 0 ? "" : "; ") + refusals[i];
    }
    if (refusals.size() > mostTold) {
        text += "; and " + std::to_string(refusals.size() - mostTold) + " more";
    }
    throw Failure(ExitStatus::notDone,
                  about + text + "; nothing was changed, --force does it all the same");
}

void prepareFile(const RenameCommand& command, RenameReport& report) {
    if (!ZR::File::exists(ZR::make_wstring(report.file))) {
        if (!command.create) {
            throw Failure(ExitStatus::notDone, report.interfaceName +
                                                   " has no configuration file: there is no " +
                                                   printable(report.file) + "; --create makes it");
        }
        refuse(refusalsOfName(report.interfaceName),
               "the file's first line would be DEVICE=" + printable(report.interfaceName) + ": ",
               command);
        report.directoryCreated = createDataDirectory(report.dataDir);
        createConfigurationFile(report.file, report.interfaceName, command.name);
        report.fileCreated = true;
        return;
    }
    // What cannot be read is left to the provider, which leaves it as it is.
    if (const auto content = ZR::File::read(report.file)) {
        refuse(refusalsOfContent(*content), printable(report.file) + ": ", command);
        if (lacksLineEnd(*content)) {
            endLastLine(report.file);
            report.lineEnded = true;
        }
    }
}

/// Lets the provider write the name, and reads it back.
void change(const cimom::ObjectPath& path, const RenameReport& report, Client& client) {
    const cimom::Instance wanted{path, {{nameProperty, cimom::Value::ofString(report.newName)}}};
    const Response response = client.modify(wanted, {nameProperty});
    if (!response.status.ok()) {
        throw client.failure(response, path);
    }
    const std::string name = nameNow(path, client);
    if (name == report.newName) {
        return;
    }
    const std::string about = "the configuration name of " + printable(report.interfaceName);
    if (name != report.oldName) {
        throw Failure(ExitStatus::notDone, about + " is now \"" + printable(name) + '"');
    }
    throw Failure(ExitStatus::notDone,
                  about + " is still \"" + printable(name) + "\": " +
                      (report.file.empty()
                           ? "that machine has no configuration file for it, or cannot write it"
                           : printable(whyUnchanged(report.file))));
}

/// What is so after a failure, behind its message.
std::string stateNow(const RenameReport& report, const Failure& failure) {
    if (report.file.empty()) {
        // A server that does not respond may have carried the request out.
        return failure.status() == ExitStatus::notLoaded
                   ? "; whether the name was changed is not known"
                   : "";
    }
    return "; " + std::string(report.fileCreated ? "made by this command, " : "") +
           printable(nameInFile(report.file));
}

std::string fileOf(const Setting& setting, const std::string& dataDir) {
    auto file = ZR::InterfaceFile::path(dataDir, setting.interfaceName);
    if (!file) {
        throw Failure(ExitStatus::notDone, "the name \"" + printable(setting.interfaceName) +
                                               "\" cannot be part of a file's name: such an "
                                               "interface has no configuration file");
    }
    return *std::move(file);
}

}  // namespace

RenameReport rename(const RenameCommand& command, Client& client) {
    if (!canBeConfigurationName(command.name)) {
        throw Failure(ExitStatus::usage,
                      "\"" + printable(command.name) +
                          "\" cannot be a configuration name: it must be one line, without blanks "
                          "at its ends or quotation marks around it");
    }
    refuse(refusalsOfName(command.name), "the line would be " + nameLineOf(command.name) + ": ",
           command);
    const Setting setting = find(command.interfaceName, settings(client));
    RenameReport report;
    report.interfaceName = setting.interfaceName;
    report.newName = command.name;
    if (const auto dataDir = client.dataDir()) {
        report.dataDir = *dataDir;
        report.file = fileOf(setting, *dataDir);
    }
    report.oldName = nameNow(setting.path, client);
    if (!report.file.empty()) {
        prepareFile(command, report);
    }

    try {
        change(setting.path, report, client);
    } catch (const Failure& failure) {
        throw Failure(failure.status(), failure.what() + stateNow(report, failure));
    }
    return report;
}

std::string renameText(const RenameReport& report) {
    std::string text;
    if (report.directoryCreated) {
        text += "Made the directory " + printable(report.dataDir) + ".\n";
    }
    if (report.fileCreated) {
        text += "Made the file " + printable(report.file) + ".\n";
    }
    if (report.lineEnded) {
        text += "Ended the last line of " + printable(report.file) + ".\n";
    }
    text += printable(report.interfaceName) + ": the configuration name is now \"" +
            printable(report.newName) + '"';
    if (!report.oldName.empty()) {
        text += ", was \"" + printable(report.oldName) + '"';
    }
    return text + (report.file.empty() ? "" : " (" + printable(report.file) + ')') + ".\n";
}

std::string renameRemarks(const RenameCommand& command, const RenameReport& report) {
    if (!report.file.empty() || command.force) {
        return {};
    }
    return "cimdhcp: the configuration file on that machine could not be looked at first: lines "
           "that only contain CONFIG_NAME were replaced, too, and a last line without an end was "
           "written on, if there were any\n";
}

std::string renameJson(const RenameReport& report) {
    return jsonText(JsonMembers{{"operation", "rename"},
                                {"interface", report.interfaceName},
                                {"file", textOrNull(report.file)},
                                {"fileCreated", report.fileCreated},
                                {"directoryCreated", report.directoryCreated},
                                {"lineEnded", report.lineEnded},
                                {"oldName", textOrNull(report.oldName)},
                                {"newName", report.newName}});
}

}  // namespace cimdhcp

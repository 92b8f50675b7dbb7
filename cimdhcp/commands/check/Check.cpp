#include "commands/check/Check.h"

#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <optional>
#include <sstream>
#include <utility>

#include "arguments/Directories.h"
#include "cimom/Instance.h"
#include "client/EmbeddedClient.h"
#include "client/Response.h"
#include "commands/DiagnosticText.h"
#include "commands/PlatformSetup.h"
#include "commands/check/Findings.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "zrclient/InstrumentationService.h"
#include "zrcommon/BuiltSources.h"
#include "zrcommon/PlatformSettings.h"

namespace cimdhcp {

namespace {

namespace fs = std::filesystem;
using Verdict = Finding::Verdict;

/// What was found, part after part.
class Examination {
  public:
    Examination(const Options& options, const std::vector<Directories>& installations,
                std::int64_t now, const TellStep& tell)
        : options_(options), installations_(installations), now_(now), tell_(tell) {}

    std::vector<Finding> examine() {
        const bool machine = lookAtSettings();
        lookAtDataDirectory(ZR::PlatformSettings::process().dataDir, findings_);
        if (machine) {
            lookAtMachine();
        }
        if (const auto directories = lookAtInstallation()) {
            if (openClient(*directories)) {
                lookAtLibraries(*directories);
                lookAtClasses();
            }
        }
        return std::move(findings_);
    }

  private:
    void add(Verdict verdict, std::string what, std::string detail, std::string remedy = "") {
        findings_.push_back({verdict, std::move(what), std::move(detail), std::move(remedy)});
    }

    /// False when the tree cannot be read, so that there is no machine to examine.
    bool lookAtSettings() {
        std::ostringstream warnings;
        std::optional<Failure> failure;
        try {
            // Whether the machine can be watched is to be seen, too.
            setUpPlatform(options_, Look::again, warnings);
        } catch (const Failure& error) {
            failure = error;
        }
        const ZR::PlatformSettings& settings = ZR::PlatformSettings::process();
        const char* const named = std::getenv("ZR_CONFIG");
        const std::string file = named == nullptr ? ZR::PlatformSettings::defaultFile : named;
        for (const std::string& diagnostic : settings.diagnostics) {
            add(Verdict::bad, "settings", printable(diagnostic),
                "correct it; docs/settings.md lists the settings");
        }
        if (settings.diagnostics.empty()) {
            std::error_code error;
            const bool there = fs::exists(file, error);
            add(Verdict::good, "settings",
                there ? file + " is read" : "no " + file + ": every setting has its default");
        }
        if (failure) {
            add(Verdict::bad, "tree", failure->what(),
                "name another file with --tree or INSTRUMENTATION_TREE, or none for the live "
                "machine");
        }
        return !failure;
    }

    void lookAtMachine() {
        const std::string& tree = treeName();
        const auto snapshot = ZR::InstrumentationService::process().current();
        const auto diagnostics = snapshot->diagnostics();
        const MachineInterfaces machine{interfacesOf(*snapshot),
                                        {diagnostics.begin(), diagnostics.end()}};
        const std::size_t interfaces = machine.interfaces.size();
        dhcpInterfaces_ = static_cast<std::size_t>(
            std::count_if(machine.interfaces.begin(), machine.interfaces.end(),
                          [](const InterfaceOverview& each) { return each.dhcp.value_or(false); }));
        const std::string where = tree.empty() ? "the live machine" : "tree " + tree;
        const std::string detail = where + " has " +
                                   counted(interfaces, "interface", "interfaces") + ", " +
                                   std::to_string(dhcpInterfaces_) + " of them with DHCP";
        if (dhcpInterfaces_ > 0) {
            add(Verdict::good, "machine", detail);
        } else {
            add(Verdict::notable, "machine", detail + ": the DHCP classes are empty",
                "\"cimdhcp tree --explain\" shows what is seen, and from where; DHCP is on where a "
                "client runs or the address came from one");
        }
        if constexpr (!ZR::Built::leftOut.empty()) {
            add(Verdict::notable, "build", "it is without " + std::string(ZR::Built::leftOut),
                "where the machine has one of these, use a build that has it, too (ZR_WITHOUT)");
        }
        for (Finding& finding : machineFindings(machine, now_)) {
            findings_.push_back(std::move(finding));
        }
    }

    std::optional<Directories> lookAtInstallation() {
        try {
            Directories directories = findDirectories(options_, installations_);
            // Throws what is wrong with the registrations' directory.
            const auto files = registrationFiles(directories.registrations);
            add(Verdict::good, "installation",
                "schema in " + directories.schema.string() + ", " +
                    counted(files.size(), "registration file", "registration files") + " in " +
                    directories.registrations.string());
            return directories;
        } catch (const Failure& failure) {
            add(Verdict::bad, "installation", failure.what(),
                "install again, or name the directories by options (cimdhcp --help)");
            return std::nullopt;
        }
    }

    bool openClient(const Directories& directories) {
        try {
            client_.emplace(directories, options_.nameSpace);
        } catch (const Failure& failure) {
            add(Verdict::bad, "schema and registration", failure.what(),
                "correct the file at that place, or install again");
            return false;
        }
        add(Verdict::good, "schema",
            counted(client_->repository().classes().size(), "class", "classes"));
        const auto& registrations = client_->registrations();
        const auto elsewhere = std::count_if(
            registrations.begin(), registrations.end(), [this](const cimom::Registration& each) {
                return std::find(each.nameSpaces.begin(), each.nameSpaces.end(),
                                 options_.nameSpace) == each.nameSpaces.end();
            });
        if (std::cmp_equal(elsewhere, registrations.size())) {
            add(Verdict::bad, "registration", "no class is served in " + options_.nameSpace,
                "name the namespace of the registration files with --namespace");
        } else {
            add(Verdict::good, "registration",
                counted(registrations.size(), "class is served", "classes are served"));
        }
        return true;
    }

    void lookAtLibraries(const Directories& directories) {
        std::vector<std::string> seen;
        for (const cimom::Registration& registration : client_->registrations()) {
            if (std::find(seen.begin(), seen.end(), registration.location) != seen.end()) {
                continue;
            }
            seen.push_back(registration.location);
            lookAtLibrary(registration.location, directories);
        }
    }

    void lookAtLibrary(const std::string& location, const Directories& directories) {
        const std::string name = "lib" + location + ".so";
        for (const fs::path& directory : directories.providers) {
            std::error_code error;
            if (fs::exists(directory / name, error)) {
                add(Verdict::good, "library", (directory / name).string());
                lookAtFactories(location);
                return;
            }
        }
        std::string searched;
        for (const fs::path& directory : directories.providers) {
            searched += (searched.empty() ? "" : ", ") + directory.string();
        }
        add(Verdict::bad, "library", name + " is not in " + searched,
            "install the provider, or name its directory with --provider-dir");
    }

    void lookAtFactories(const std::string& location) {
        std::vector<std::string> seen;
        for (const cimom::Registration& each : client_->registrations()) {
            if (each.location == location &&
                std::find(seen.begin(), seen.end(), each.provider) == seen.end()) {
                seen.push_back(each.provider);
                lookAtFactoriesOf(each.provider);
            }
        }
    }

    /// Calls that need the one and the other factory of a provider.
    void lookAtFactoriesOf(const std::string& provider) {
        const cimom::Registration* instance = nullptr;
        const cimom::Registration* association = nullptr;
        for (const cimom::Registration& each : client_->registrations()) {
            if (each.provider == provider && !each.nameSpaces.empty()) {
                instance = instance == nullptr && each.instance ? &each : instance;
                association = association == nullptr && each.association ? &each : association;
            }
        }
        if (instance != nullptr) {
            reportFactory("instance factory", *instance,
                          client_->enumerateNames(pathOf(*instance)).status);
        }
        if (association != nullptr) {
            cimom::AssociationRequest request;
            request.resultClass = association->className;
            reportFactory("association factory", *association,
                          client_->referenceNames(pathOf(*association), request).status);
        }
    }

    void reportFactory(const char* what, const cimom::Registration& registration,
                       const cimom::Status& status) {
        if (status.noProvider) {
            add(Verdict::bad, what, printable(status.message),
                "ldd shows libraries that are missing; else install the provider again");
        } else {
            add(Verdict::good, what, "of provider " + registration.provider);
        }
    }

    static cimom::ObjectPath pathOf(const cimom::Registration& registration) {
        return {"", registration.nameSpaces.front(), registration.className, {}};
    }

    /// Of classes that fail, or have no instance, those that do so for the same reason are one
    /// finding.
    void lookAtClasses() {
        std::vector<Said> failed;
        std::vector<Said> empty;
        std::size_t step = 0;
        for (const cimom::Registration& registration : client_->registrations()) {
            tell_("asking for " + registration.className, ++step, client_->registrations().size());
            if (!registration.instance || registration.nameSpaces.empty()) {
                continue;
            }
            const Response response = client_->enumerate(pathOf(registration));
            if (!response.status.ok()) {
                say(std::string(cimom::statusName(response.status.code)) +
                        (response.status.message.empty()
                             ? ""
                             : ": " + printable(response.status.message)),
                    registration.className, failed);
            } else if (response.instances.empty() &&
                       // Best when there is none.
                       registration.className != "QVXZR_DHCPDiagnostic") {
                say("no instance", registration.className, empty);
            } else {
                add(Verdict::good, registration.className,
                    counted(response.instances.size(), "instance", "instances"));
            }
        }
        for (const Said& each : failed) {
            add(Verdict::bad, shortList(each.subjects), each.what,
                "every step is in the log with ZR_LOG_SINK=stderr ZR_LOG_LEVEL=3000 cimdhcp "
                "instances " +
                    each.subjects.front());
        }
        for (const Said& each : empty) {
            add(Verdict::notable, shortList(each.subjects), each.what,
                dhcpInterfaces_ == 0 ? "see \"machine\" above"
                                     : "nothing of this kind is on the machine now; the log "
                                       "tells every step with ZR_LOG_SINK=stderr "
                                       "ZR_LOG_LEVEL=3000");
        }
    }

    const Options& options_;
    const std::vector<Directories>& installations_;
    std::int64_t now_;
    const TellStep& tell_;
    std::vector<Finding> findings_;
    std::optional<EmbeddedClient> client_;
    std::size_t dhcpInterfaces_ = 0;
};

}  // namespace

std::vector<Finding> check(const Options& options, const std::vector<Directories>& installations,
                           std::int64_t now, const TellStep& tell) {
    return Examination(options, installations, now, tell).examine();
}

}  // namespace cimdhcp

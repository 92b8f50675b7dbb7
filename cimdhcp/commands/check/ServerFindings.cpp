#include "commands/check/Findings.h"

#include <algorithm>
#include <array>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <variant>

#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimom/ObjectPathText.h"
#include "cimom/Requests.h"
#include "client/Client.h"
#include "client/Response.h"
#include "text/DisplayText.h"

namespace cimdhcp {

namespace {

using Verdict = Finding::Verdict;

struct ServedClass {
    std::string_view name;
    bool farEnd = false;    ///< served by the neighbours
    bool mayBeNone = true;  ///< false: every machine has an instance
};

constexpr std::array<ServedClass, 15> servedClasses{{
    {"QVXZR_DHCPProtocolEndpoint"},
    {"QVXZR_DHCPCapabilities"},
    {"QVXZR_DHCPRemoteServiceAccessPoint"},
    {"QVXZR_DHCPSettingData"},
    {"QVXZR_DHCPElementCapabilities"},
    {"QVXZR_SAPSAPDependency"},
    {"QVXZR_HostedDHCPPoint"},
    {"QVXZR_DHCPRemoteAccessAvailableToElement"},
    {"QVXZR_DHCPRemoteHostedAccessPoint"},
    {"QVXZR_DHCPElementSettingData"},
    {"QVXZR_DHCPOrderedComponent"},
    {"QVXZR_ComputerSystem", true, false},
    {"QVXZR_SPComputerSystem", true},
    {"QVXZR_IPProtocolEndpoint", true},
    {"QVXZR_IPAssignmentSettingData", true},
}};

constexpr const char* putGatewayInFront =
    "the exact provider gives this where no gateway is in front of it: provider-register.sh, "
    "without --exact, puts one there";
constexpr const char* registerNeighbours =
    "register the neighbours, too: they are in libDHCPClient.so, which provider-register.sh "
    "registers without --exact; with it, install cmpi-dhcp-client-neighbours before";
constexpr const char* seeTheLog =
    "the provider's log tells every step with LOG_LEVEL=3000 in the settings, and the object "
    "manager's log what it did with the library";

/// What a status in place of instances comes from.
const char* remedyFor(const cimom::Status& status) {
    switch (status.code) {
        case CMPI_RC_ERR_ACCESS_DENIED:
            return "name a user who may read, with --credentials";
        case CMPI_RC_ERR_INVALID_NAMESPACE:
            return "name the namespace of the registration with --namespace; where nothing is "
                   "registered yet, provider-register.sh does it";
        case CMPI_RC_ERR_INVALID_CLASS:
            return "the object manager does not know the class: run provider-register.sh on that "
                   "machine, and restart SFCB";
        case CMPI_RC_ERR_NOT_SUPPORTED:
            return "the class has no provider, or the provider's module is disabled: \"cimprovider "
                   "-l -s\" shows the modules of OpenPegasus, -e -m MODULE enables one; else run "
                   "provider-register.sh";
        case CMPI_RC_ERR_NOT_FOUND:
        case CMPI_RC_ERR_FAILED:
            return "the library is not in a directory where the object manager looks (providerDirs "
                   "in sfcb.cfg, providerDir of OpenPegasus), lacks a library that it needs (ldd), "
                   "or has ended its process; the object manager's log tells which";
        default:
            return seeTheLog;
    }
}

std::string statusText(const cimom::Status& status) {
    const std::string name(statusNameOf(status));
    // Some servers begin their words with the name.
    std::string words = status.message.starts_with(name + ": ")
                            ? status.message.substr(name.size() + 2)
                            : status.message;
    return words.empty() ? name : name + ": " + printable(words);
}

std::string textOf(const cimom::ObjectPath& path) {
    return printable(cimom::toText({"", "", path.className, path.keys}));
}

const std::shared_ptr<const cimom::ObjectPath>* referenceIn(const cimom::Value& value) {
    const cimom::Scalar* const scalar = value.scalar();
    return scalar == nullptr ? nullptr
                             : std::get_if<std::shared_ptr<const cimom::ObjectPath>>(scalar);
}

bool samePath(const cimom::ObjectPath& a, const cimom::ObjectPath& b);

/// Whether two keys mean the same: of references, neither host nor namespace counts, which
/// object managers fill in or leave out, and of numbers not the type.
bool sameKey(const cimom::Value& a, const cimom::Value& b) {
    const auto* const first = referenceIn(a);
    const auto* const second = referenceIn(b);
    if (first != nullptr && second != nullptr) {
        return samePath(**first, **second);
    }
    return a.content == b.content;
}

bool samePath(const cimom::ObjectPath& a, const cimom::ObjectPath& b) {
    return cimom::sameName(a.className, b.className) && a.keys.size() == b.keys.size() &&
           std::all_of(a.keys.begin(), a.keys.end(), [&b](const cimom::NamedValue& each) {
               const cimom::Value* const other = b.key(each.name);
               return other != nullptr && sameKey(each.value, *other);
           });
}

/// Whether what the instance tells of itself agrees with the path that was asked for.
bool isInstanceOf(const cimom::Instance& instance, const cimom::ObjectPath& path) {
    return cimom::sameName(instance.path.className, path.className) &&
           std::all_of(path.keys.begin(), path.keys.end(), [&](const cimom::NamedValue& each) {
               const cimom::Value* const property = instance.property(each.name);
               return property != nullptr && sameKey(each.value, *property);
           });
}

/// The path of an instance that no machine has; none for a class whose keys are references.
std::optional<cimom::ObjectPath> pathOfNothing(cimom::ObjectPath path) {
    for (const std::string_view name : {"InstanceID", "Name"}) {
        for (cimom::NamedValue& each : path.keys) {
            const cimom::Scalar* const scalar = each.value.scalar();
            const auto* const text = scalar == nullptr ? nullptr : std::get_if<std::string>(scalar);
            if (text != nullptr && cimom::sameName(each.name, name)) {
                each.value = cimom::Value::ofString(*text + "-none");
                return path;
            }
        }
    }
    return std::nullopt;
}

class ServerExamination {
  public:
    ServerExamination(Client& client, const TellStep& tell) : client_(client), tell_(tell) {}

    std::vector<Finding> examine() {
        constexpr std::size_t steps = 2 * servedClasses.size();
        std::size_t step = 0;
        for (const ServedClass& each : servedClasses) {
            tell_("asking for " + std::string(each.name), ++step, steps);
            try {
                enumerate(each);
                hasResponded_ = true;
            } catch (const Failure& failure) {
                if (!hasResponded_) {
                    throw;
                }
                // Of a server that has responded, silence is a wrong response, too.
                addAlike(Verdict::bad, each.name, failure.what(), seeTheLog);
            }
        }
        if (std::none_of(served_.begin(), served_.end(),
                         [](const Served& each) { return !each.paths.empty(); })) {
            tellOfNothing();
        } else {
            for (const Served& each : served_) {
                tell_("following " + std::string(each.served->name), ++step, steps);
                lookAt(each);
            }
        }
        return std::move(findings_);
    }

  private:
    struct Wrong {
        std::string detail;
        const char* remedy;
        std::size_t others = 0;
    };
    struct Served {
        const ServedClass* served = nullptr;
        std::vector<cimom::ObjectPath> paths;  ///< those that the enumeration of instances gave
    };

    void add(Verdict verdict, std::string_view what, std::string detail, std::string remedy = "") {
        findings_.push_back({verdict, std::string(what), std::move(detail), std::move(remedy)});
    }

    /// A response that is wrong. Of those of one class with one remedy, the first stands for
    /// all.
    void addWrong(const std::string& detail, const char* remedy) {
        for (Wrong& each : wrong_) {
            if (each.remedy == std::string_view(remedy)) {
                ++each.others;
                return;
            }
        }
        wrong_.push_back({detail, remedy});
    }

    void enumerate(const ServedClass& each) {
        const Response response = client_.enumerate(client_.classPath(std::string(each.name)));
        if (!response.status.ok()) {
            addAlike(Verdict::bad, each.name, statusText(response.status),
                     remedyFor(response.status));
            return;
        }
        Served served{&each, {}};
        for (const std::optional<cimom::Instance>& instance : response.instances) {
            if (instance) {
                served.paths.push_back(instance->path);
            }
        }
        served_.push_back(std::move(served));
    }

    /// What is the same about several classes is one finding.
    void addAlike(Verdict verdict, std::string_view className, const std::string& detail,
                  const char* remedy) {
        const auto same = std::find_if(
            findings_.begin(), findings_.end(),
            [&](const Finding& each) { return each.verdict == verdict && each.detail == detail; });
        if (same == findings_.end()) {
            add(verdict, className, detail, remedy);
        } else {
            same->what += ", " + std::string(className);
        }
    }

    void tellOfNothing() {
        if (!served_.empty()) {
            add(Verdict::bad, "classes",
                "are known, and none has an instance, not even QVXZR_ComputerSystem",
                "no provider is registered for them (run provider-register.sh on that machine, "
                "and restart SFCB), or its settings name a tree that cannot be read");
        }
    }

    void lookAt(const Served& each) {
        if (each.paths.empty()) {
            tellOfNone(*each.served);
            return;
        }
        try {
            lookAtInstances(each);
        } catch (const Failure& failure) {
            addWrong(failure.what(), seeTheLog);
        }
        if (wrong_.empty()) {
            add(Verdict::good, each.served->name,
                counted(each.paths.size(), "instance", "instances"));
        }
        tellOfWrong(each.served->name);
    }

    void lookAtInstances(const Served& each) {
        compareNames(each);
        follow(*each.served, each.paths.front());
        if (each.paths.size() > 1) {
            follow(*each.served, each.paths.back());
        }
        if (const auto nothing = pathOfNothing(each.paths.back())) {
            getNothing(*each.served, *nothing);
        }
    }

    void tellOfWrong(std::string_view className) {
        for (const Wrong& wrong : wrong_) {
            add(Verdict::bad, className,
                wrong.detail +
                    (wrong.others == 0
                         ? ""
                         : " (and " + counted(wrong.others, "response", "responses") + " like it)"),
                wrong.remedy);
        }
        wrong_.clear();
    }

    void tellOfNone(const ServedClass& served) {
        if (served.mayBeNone) {
            addAlike(Verdict::notable, served.name, "no instance",
                     "\"cimdhcp check\" on that machine tells why, if it should have one");
        } else {
            add(Verdict::bad, served.name, "no instance, and every machine has one",
                registerNeighbours);
        }
    }

    void compareNames(const Served& each) {
        const std::string name(each.served->name);
        const Response names = client_.enumerateNames(client_.classPath(name));
        if (!names.status.ok()) {
            addWrong("EnumerateInstanceNames: " + statusText(names.status), seeTheLog);
        } else if (names.paths.size() != each.paths.size()) {
            addWrong("EnumerateInstances gives " +
                         counted(each.paths.size(), "instance", "instances") +
                         ", EnumerateInstanceNames " + counted(names.paths.size(), "name", "names"),
                     "check again: an interface may have come or gone meanwhile");
        }
    }

    void get(const ServedClass& served, const cimom::ObjectPath& path) {
        const Response response = client_.get(path);
        if (!response.status.ok()) {
            addWrong("GetInstance of " + textOf(path) +
                         ", which is enumerated: " + statusText(response.status),
                     served.farEnd ? seeTheLog : putGatewayInFront);
        } else if (response.instances.empty() || !response.instances.front() ||
                   !isInstanceOf(*response.instances.front(), path)) {
            addWrong("GetInstance of " + textOf(path) + " gives another instance",
                     putGatewayInFront);
        }
    }

    void getNothing(const ServedClass& served, const cimom::ObjectPath& path) {
        const Response response = client_.get(path);
        if (response.status.ok() && !response.instances.empty()) {
            addWrong("GetInstance of " + textOf(path) + ", which there is not, gives an instance",
                     served.farEnd ? seeTheLog : putGatewayInFront);
        }
    }

    /// An instance can be got. An association leads to instances that there are; any other
    /// instance is an end of what refers to it.
    void follow(const ServedClass& served, const cimom::ObjectPath& path) {
        get(served, path);
        bool association = false;
        for (const cimom::NamedValue& key : path.keys) {
            if (const auto* const end = referenceIn(key.value)) {
                association = true;
                followTo(key.name, **end);
            }
        }
        if (!association) {
            lookAtReferences(path);
        }
    }

    void followTo(const std::string& role, const cimom::ObjectPath& end) {
        const Response response = client_.get(end);
        if (response.status.ok()) {
            return;
        }
        const auto isEnd = [&end](const ServedClass& each) {
            return each.farEnd && cimom::sameName(each.name, end.className);
        };
        addWrong(role + " leads to " + textOf(end) + ": " + statusText(response.status),
                 std::any_of(servedClasses.begin(), servedClasses.end(), isEnd)
                     ? registerNeighbours
                     : putGatewayInFront);
    }

    void lookAtReferences(const cimom::ObjectPath& path) {
        const Response response = client_.referenceNames(path, {});
        if (!response.status.ok()) {
            addWrong("ReferenceNames of " + textOf(path) + ": " + statusText(response.status),
                     response.status.code == CMPI_RC_ERR_INVALID_CLASS
                         ? putGatewayInFront
                         : remedyFor(response.status));
            return;
        }
        const auto strange =
            std::count_if(response.paths.begin(), response.paths.end(), [&path](const auto& each) {
                return each && std::none_of(each->keys.begin(), each->keys.end(),
                                            [&path](const cimom::NamedValue& key) {
                                                const auto* const end = referenceIn(key.value);
                                                return end != nullptr && samePath(**end, path);
                                            });
            });
        if (strange > 0) {
            addWrong(std::to_string(strange) + " of " +
                         counted(response.paths.size(), "reference", "references") + " to " +
                         textOf(path) + " do not name it",
                     putGatewayInFront);
        }
    }

    Client& client_;
    const TellStep& tell_;
    std::vector<Served> served_;
    std::vector<Wrong> wrong_;  ///< of the class that is looked at
    bool hasResponded_ = false;
    std::vector<Finding> findings_;
};

}  // namespace

std::vector<Finding> serverFindings(Client& client, const TellStep& tell) {
    return ServerExamination(client, tell).examine();
}

}  // namespace cimdhcp

#include "commands/Profiles.h"

#include <array>
#include <utility>
#include <variant>

#include "cimom/Names.h"
#include "cimom/Requests.h"
#include "client/Client.h"
#include "client/Response.h"
#include "text/JsonText.h"
#include "text/ValueMeaning.h"

namespace cimdhcp {

namespace {

constexpr const char* profileClass = "CIM_RegisteredProfile";

/// The class where the namespaces of a server are told: the same in all of them.
constexpr const char* nameSpaceClass = "CIM_Namespace";

/// What servers call it.
constexpr std::array interopNames{"root/interop", "interop", "root/PG_InterOp"};

/// The number of instances that conform to a profile.
std::optional<std::uint64_t> conforming(Client& client, const cimom::ObjectPath& profile) {
    cimom::AssociationRequest request;
    request.assocClass = "CIM_ElementConformsToProfile";
    request.resultRole = "ManagedElement";
    const Response response = client.associatorNames(profile, request);
    return response.status.ok() ? std::optional<std::uint64_t>(response.paths.size())
                                : std::nullopt;
}

/// By the numbers of RegisteredOrganization; of another one than those, its name.
std::string organizationOf(const cimom::Instance& instance) {
    const cimom::Value* const value = instance.property("RegisteredOrganization");
    const cimom::Scalar* const scalar = value == nullptr ? nullptr : value->scalar();
    const auto* const number = scalar == nullptr ? nullptr : std::get_if<std::uint64_t>(scalar);
    if (number == nullptr) {
        return "";
    }
    // Few of them have profiles.
    switch (*number) {
        case 1:
            return heldText(instance.property("OtherRegisteredOrganization"));
        case 2:
            return "DMTF";
        case 11:
            return "SNIA";
        case 13:
            return "The Open Group";
        default:
            return std::to_string(*number);
    }
}

}  // namespace

std::string interopNamespace(Client& client) {
    for (const char* name : interopNames) {
        const cimom::ObjectPath path{"", name, nameSpaceClass, {}};
        const Response response = client.enumerateNames(path);
        if (response.status.code == CMPI_RC_ERR_INVALID_NAMESPACE) {
            continue;
        }
        const bool classLacks = response.status.code == CMPI_RC_ERR_INVALID_CLASS ||
                                response.status.code == CMPI_RC_ERR_NOT_FOUND ||
                                response.status.code == CMPI_RC_ERR_NOT_SUPPORTED;
        if (!response.status.ok() && !classLacks) {
            throw client.failure(response, path);
        }
        for (const auto& each : response.paths) {
            std::string told = each ? heldText(each->key("Name")) : "";
            if (cimom::sameName(told, name)) {
                return told;
            }
        }
        return name;
    }
    throw Failure(ExitStatus::notDone,
                  "the server has no interop namespace: neither interop, root/interop nor "
                  "root/PG_InterOp");
}

Profiles readProfiles(Client& client) {
    Profiles profiles;
    profiles.nameSpace = interopNamespace(client);
    const cimom::ObjectPath path{"", profiles.nameSpace, profileClass, {}};
    Response response = client.enumerate(path);
    if (!response.status.ok()) {
        throw client.failure(response, path);
    }
    for (const auto& instance : response.instances) {
        if (!instance) {
            continue;
        }
        cimom::ObjectPath own = instance->path;
        own.nameSpace = profiles.nameSpace;
        profiles.profiles.push_back(
            {organizationOf(*instance), heldText(instance->property("RegisteredName")),
             heldText(instance->property("RegisteredVersion")),
             heldText(instance->property("InstanceID")), conforming(client, own)});
    }
    return profiles;
}

const std::vector<Column<Profile>>& profileColumns() {
    static const std::vector<Column<Profile>> columns{
        {"ORGANIZATION", [](const Profile& each) { return cellOf(each.organization); }},
        {"PROFILE", [](const Profile& each) { return cellOf(each.name); }},
        {"VERSION", [](const Profile& each) { return cellOf(each.version); }},
        {"INSTANCES", [](const Profile& each) {
             return each.instances ? std::to_string(*each.instances) : "-";
         }}};
    return columns;
}

std::string profileTable(const std::vector<Profile>& profiles, std::optional<std::size_t> width,
                         const Style& style) {
    if (profiles.empty()) {
        return style.header ? "No profile is advertised.\n" : "";
    }
    return tableOf(profileColumns(), profiles).text(width, style);
}

std::string profileJson(const std::string& nameSpace, const std::vector<Profile>& profiles) {
    JsonList list;
    for (const Profile& each : profiles) {
        list.push_back(
            JsonMembers{{"organization", textOrNull(each.organization)},
                        {"name", textOrNull(each.name)},
                        {"version", textOrNull(each.version)},
                        {"id", textOrNull(each.id)},
                        {"instances", each.instances ? Json(*each.instances) : Json(nullptr)}});
    }
    return jsonText(JsonMembers{{"namespace", nameSpace}, {"profiles", std::move(list)}});
}

}  // namespace cimdhcp

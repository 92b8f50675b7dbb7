#include "commands/WatchSubscriptions.h"

#include <netdb.h>
#include <pwd.h>
#include <sys/random.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <sstream>
#include <utility>

#include "cimom/Instance.h"
#include "client/Response.h"
#include "commands/Profiles.h"
#include "text/DisplayText.h"
#include "text/Failure.h"
#include "text/ValueMeaning.h"
#include "transport/ListeningSocket.h"
#include "zrcommon/File.h"
#include "zrcommon/SystemName.h"
#include "zrcommon/UniqueFd.h"

namespace cimdhcp {

namespace {

constexpr const char* filterClass = "CIM_IndicationFilter";
constexpr const char* destinationClass = "CIM_ListenerDestinationCIMXML";
constexpr const char* subscriptionClass = "CIM_IndicationSubscription";

// Some servers take no filter of a common superclass.
constexpr std::array indicationClasses{"CIM_InstCreation", "CIM_InstModification",
                                       "CIM_InstDeletion"};

/// What a look shows comes from these.
constexpr std::array watchedClasses{"QVXZR_DHCPLease", "QVXZR_DHCPProtocolEndpoint",
                                    "QVXZR_DHCPInterface"};

std::string condition() {
    std::string text;
    for (const char* className : watchedClasses) {
        text += (text.empty() ? " WHERE SourceInstance ISA " : " OR SourceInstance ISA ");
        text += className;
    }
    return text;
}

using cimom::Instance;
using cimom::NamedValue;
using cimom::ObjectPath;
using cimom::Value;

/// The clock ticks after the boot at which a process started; none: there is no such process.
std::optional<std::uint64_t> startOf(std::uint64_t process) {
    constexpr int fieldOfStart = 22;
    const auto text = ZR::File::read("/proc/" + std::to_string(process) + "/stat");
    // The name of the program is in parentheses, and may hold any of them.
    const std::size_t end = text ? text->rfind(')') : std::string::npos;
    if (end == std::string::npos) {
        return std::nullopt;
    }
    std::istringstream fields(text->substr(end + 1));
    std::string field;
    for (int number = 3; number <= fieldOfStart; ++number) {
        fields >> field;
    }
    std::uint64_t start = 0;
    std::from_chars(field.data(), field.data() + field.size(), start);
    return fields ? std::optional(start) : std::nullopt;
}

bool runs(std::uint64_t process, std::uint64_t start) {
    return startOf(process) == start;
}

std::string userName() {
    const passwd* const user = ::getpwuid(::geteuid());
    return user == nullptr ? std::to_string(::geteuid()) : user->pw_name;
}

std::string randomText() {
    std::array<std::uint8_t, 16> bytes{};
    if (::getrandom(bytes.data(), bytes.size(), 0) != static_cast<ssize_t>(bytes.size())) {
        throw Failure(ExitStatus::notLoaded,
                      std::string("no random number: ") + std::strerror(errno));
    }
    std::string text;
    for (const std::uint8_t byte : bytes) {
        constexpr std::string_view digits = "0123456789abcdef";
        text += digits[byte >> 4U];
        text += digits[byte & 15U];
    }
    return text;
}

/// The address of this machine from which a server is reached.
std::string localAddressTo(const ServerUrl& url) {
    addrinfo hints{};
    hints.ai_socktype = SOCK_DGRAM;
    addrinfo* found = nullptr;
    const int error =
        ::getaddrinfo(url.host.c_str(), std::to_string(url.port).c_str(), &hints, &found);
    if (error != 0) {
        throw Failure(ExitStatus::notLoaded, ::gai_strerror(error));
    }
    const std::unique_ptr<addrinfo, void (*)(addrinfo*)> owned(found, ::freeaddrinfo);
    for (const addrinfo* each = found; each != nullptr; each = each->ai_next) {
        const ZR::UniqueFd socket{
            ::socket(each->ai_family, each->ai_socktype | SOCK_CLOEXEC, each->ai_protocol)};
        sockaddr_storage own{};
        auto* const generic = static_cast<sockaddr*>(static_cast<void*>(&own));
        socklen_t length = sizeof own;
        // Nothing is sent: the kernel only looks for the way.
        if (socket && ::connect(socket.get(), each->ai_addr, each->ai_addrlen) == 0 &&
            ::getsockname(socket.get(), generic, &length) == 0) {
            return cimom::wbem::addressText(generic);
        }
    }
    throw Failure(ExitStatus::notLoaded, "this machine has no way to it");
}

NamedValue text(const char* name, std::string value) {
    return {name, Value::ofString(std::move(value))};
}

NamedValue number(const char* name, std::uint64_t value) {
    return {name, {cimom::Type::uint16, false, cimom::Scalar(value)}};
}

NamedValue reference(const char* name, const ObjectPath& path) {
    return {
        name,
        {cimom::Type::reference, false, cimom::Scalar(std::make_shared<const ObjectPath>(path))}};
}

Instance instanceOf(const std::string& nameSpace, const char* className,
                    std::vector<NamedValue> properties) {
    return {{"", nameSpace, className, {}}, std::move(properties)};
}

/// The path of what was created, as the server has it.
ObjectPath createdPath(const RemoteClient& client, const Instance& instance,
                       const Response& response) {
    if (!response.status.ok()) {
        throw Failure(ExitStatus::notDone,
                      "it takes no subscription (" +
                          std::string(client.failure(response, instance.path).what()) +
                          "); --poll SECONDS looks again and again");
    }
    if (response.paths.empty() || !response.paths.front()) {
        throw Failure(ExitStatus::notLoaded, "the response has no path of what was created");
    }
    ObjectPath path = *response.paths.front();
    path.nameSpace = instance.path.nameSpace;
    return path;
}

ObjectPath create(RemoteClient& client, const Instance& instance) {
    return createdPath(client, instance, client.createInstance(instance));
}

/// Creates a filter for indications of a class: of what is watched alone, where the server
/// has a language that can say so, else of everything. More than is watched does no harm.
ObjectPath createFilter(RemoteClient& client, const Instance& filter, const char* indicationClass) {
    const std::string query = std::string("SELECT * FROM ") + indicationClass;
    const auto asking = [&filter](const std::string& words, const char* language) {
        Instance instance = filter;
        instance.properties.push_back(text("Query", words));
        instance.properties.push_back(text("QueryLanguage", language));
        return instance;
    };
    const Instance exact = asking(query + condition(), "DMTF:CQL");
    const Response response = client.createInstance(exact);
    const unsigned code = response.status.code;
    if (code == CMPI_RC_ERR_NOT_SUPPORTED || code == CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED ||
        code == CMPI_RC_ERR_INVALID_QUERY) {
        return create(client, asking(query, "WQL"));
    }
    return createdPath(client, exact, response);
}

std::string nameIn(const Value* value) {
    const cimom::Scalar* const scalar = value == nullptr ? nullptr : value->scalar();
    const auto* const path =
        scalar == nullptr ? nullptr : std::get_if<std::shared_ptr<const ObjectPath>>(scalar);
    return path == nullptr ? heldText(value) : heldText((*path)->key("Name"));
}

/// Removes what of a class is wanted. What another run removes meanwhile is gone, too.
void remove(RemoteClient& client, const std::string& nameSpace, const char* className,
            const char* key, const std::function<bool(const std::string&)>& wanted) {
    const ObjectPath all{"", nameSpace, className, {}};
    const Response found = client.enumerateNames(all);
    if (!found.status.ok()) {
        throw Failure(ExitStatus::notDone, "it takes no subscription (" +
                                               std::string(client.failure(found, all).what()) +
                                               "); --poll SECONDS looks again and again");
    }
    for (std::optional<ObjectPath> path : found.paths) {
        if (!path || !wanted(nameIn(path->key(key)))) {
            continue;
        }
        path->nameSpace = nameSpace;
        const Response removed = client.deleteInstance(*path);
        if (!removed.status.ok() && removed.status.code != CMPI_RC_ERR_NOT_FOUND) {
            throw client.failure(removed, *path);
        }
    }
}

/// Subscriptions first: what they refer to cannot be removed before them.
void removeAll(RemoteClient& client, const std::string& nameSpace,
               const std::function<bool(const std::string&)>& wanted) {
    remove(client, nameSpace, subscriptionClass, "Handler", wanted);
    remove(client, nameSpace, filterClass, "Name", wanted);
    remove(client, nameSpace, destinationClass, "Name", wanted);
}

}  // namespace

WatchName::WatchName()
    : WatchName(ZR::getSystemName(), userName(), static_cast<std::uint64_t>(::getpid()),
                startOf(static_cast<std::uint64_t>(::getpid())).value_or(0)) {}

WatchName::WatchName(std::string host, std::string user, std::uint64_t process, std::uint64_t start)
    : prefix_("cimdhcp-watch:" + std::move(host) + ':' + std::move(user) + ':'),
      text_(prefix_ + std::to_string(process) + '.' + std::to_string(start) + ':') {}

bool WatchName::mayRemove(
    std::string_view name,
    const std::function<bool(std::uint64_t process, std::uint64_t start)>& isRunning) const {
    if (name.starts_with(text_)) {
        return true;
    }
    if (!name.starts_with(prefix_)) {
        return false;
    }
    const char* const last = name.data() + name.size();
    std::uint64_t process = 0;
    const auto number = std::from_chars(name.data() + prefix_.size(), last, process);
    if (number.ec != std::errc() || number.ptr == last || *number.ptr != '.') {
        return false;
    }
    std::uint64_t start = 0;
    const auto moment = std::from_chars(number.ptr + 1, last, start);
    return moment.ec == std::errc() && moment.ptr != last && *moment.ptr == ':' &&
           !isRunning(process, start);
}

WatchSubscriptions::WatchSubscriptions(std::optional<std::string> address, std::size_t servers,
                                       std::function<void(std::size_t)> changed)
    : address_(std::move(address)),
      changed_(std::move(changed)),
      secret_(randomText()),
      states_(servers, State::nothing) {}

bool WatchSubscriptions::hasLeft(std::size_t server) const {
    const std::lock_guard lock(mutex_);
    return states_[server] != State::nothing;
}

void WatchSubscriptions::set(std::size_t server, State state) {
    const std::lock_guard lock(mutex_);
    states_[server] = state;
}

std::string WatchSubscriptions::destinationOf(std::size_t server, const ServerUrl& url) {
    const std::string address = address_ ? *address_ : localAddressTo(url);
    const std::lock_guard lock(mutex_);
    auto& listener = listeners_[address];
    if (!listener) {
        try {
            listener = std::make_unique<cimom::wbem::Listener>(
                cimom::wbem::ListenerSettings{.address = address},
                [this](const cimom::wbem::ReceivedIndication& received) {
                    const std::string beginning = '/' + secret_ + '/';
                    std::size_t number = 0;
                    const std::string& path = received.path;
                    const char* const last = path.data() + path.size();
                    if (path.starts_with(beginning) &&
                        std::from_chars(path.data() + beginning.size(), last, number).ptr == last &&
                        number < states_.size()) {
                        changed_(number);
                    }
                    return true;  // what is not ours is not to be sent again, either
                });
        } catch (const cimom::wbem::ListenerError& error) {
            listeners_.erase(address);
            throw Failure(ExitStatus::notLoaded, std::string("cannot listen: ") + error.what());
        }
    }
    cimom::wbem::HttpUrl destination{false, address, listener->port(),
                                     '/' + secret_ + '/' + std::to_string(server)};
    return destination.text();
}

void WatchSubscriptions::subscribe(std::size_t server, const ServerUrl& url, RemoteClient& client) {
    {
        const std::lock_guard lock(mutex_);
        if (states_[server] == State::complete) {
            return;
        }
    }
    const std::string destination = destinationOf(server, url);
    const std::string interop = interopNamespace(client);
    removeAll(client, interop,
              [this](const std::string& name) { return name_.mayRemove(name, runs); });
    set(server, State::begun);
    const auto named = [this](const char* ofClass, const char* what) {
        return std::vector<NamedValue>{text("CreationClassName", ofClass),
                                       text("SystemCreationClassName", "CIM_ComputerSystem"),
                                       text("Name", name_.text() + what)};
    };
    std::vector<NamedValue> properties = named(destinationClass, "listener");
    properties.push_back(text("Destination", destination));
    properties.push_back(number("PersistenceType", 3));  // transient
    const ObjectPath listener =
        create(client, instanceOf(interop, destinationClass, std::move(properties)));
    for (const char* className : indicationClasses) {
        properties = named(filterClass, className);
        properties.push_back(
            {"SourceNamespaces",
             {cimom::Type::string, true, cimom::Array{cimom::Scalar(client.nameSpace())}}});
        const ObjectPath filter = createFilter(
            client, instanceOf(interop, filterClass, std::move(properties)), className);
        create(client, instanceOf(interop, subscriptionClass,
                                  {reference("Filter", filter), reference("Handler", listener),
                                   number("OnFatalErrorPolicy", 4)}));  // remove
    }
    set(server, State::complete);
}

void WatchSubscriptions::unsubscribe(std::size_t server, RemoteClient& client) {
    removeAll(client, interopNamespace(client),
              [this](const std::string& name) { return name.starts_with(name_.text()); });
    set(server, State::nothing);
}

}  // namespace cimdhcp

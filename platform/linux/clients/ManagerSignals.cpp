#include "clients/ManagerSignals.h"

#include <algorithm>
#include <array>
#include <memory>

namespace ZR::Live {
namespace {

// A reading may wait as long for each request to a manager.
constexpr std::chrono::milliseconds timeToConnect{250};
constexpr std::chrono::seconds pauseAfterFailure{30};

// A device has many properties that change all the time, such as how well a radio is heard: the
// first argument tells which interfaces, or properties, are meant.
constexpr std::array rules{
    "type='signal',sender='org.freedesktop.NetworkManager',"
    "interface='org.freedesktop.DBus.Properties',member='PropertiesChanged',"
    "arg0='org.freedesktop.NetworkManager.Device'",
    "type='signal',sender='org.freedesktop.NetworkManager',"
    "interface='org.freedesktop.DBus.Properties',member='PropertiesChanged',"
    "arg0='org.freedesktop.NetworkManager.DHCP4Config'",
    "type='signal',sender='org.freedesktop.NetworkManager',"
    "interface='org.freedesktop.DBus.Properties',member='PropertiesChanged',"
    "arg0='org.freedesktop.NetworkManager.DHCP6Config'",
    "type='signal',sender='net.connman',interface='net.connman.Service',"
    "member='PropertyChanged',arg0='State'",
    "type='signal',sender='net.connman',interface='net.connman.Service',"
    "member='PropertyChanged',arg0='IPv4'",
    "type='signal',sender='net.connman',interface='net.connman.Service',"
    "member='PropertyChanged',arg0='IPv4.Configuration'",
};

/// What comes is looked at when it was taken from the connection, whichever rule it came by.
int leaveIt(sd_bus_message* /*message*/, void* /*self*/, sd_bus_error* /*error*/) {
    return 0;
}

}  // namespace

void ManagerSignals::follow(const ClientFacts& facts) {
    wanted_ = facts.runs(Client::NetworkManager) || facts.runs(Client::Connman);
    if (!wanted_) {
        disconnect();
    }
}

void ManagerSignals::disconnect() noexcept {
    bus_.reset();
    descriptor_ = -1;
}

bool ManagerSignals::connect(Time now) {
    if (!wanted_ || bus_ || now < rest_) {
        return false;
    }
    if (open()) {
        return true;
    }
    // Without it, changes show when the kernel or a file tells of them.
    disconnect();
    rest_ = now + pauseAfterFailure;
    return false;
}

bool ManagerSignals::open() {
    const auto functions = SdBus::get();
    if (!functions->missing().empty()) {
        return false;
    }
    sd_bus* opened = nullptr;
    const int error = functions->openSystem(&opened);
    bus_ = BusConnection(opened, CloseBus{functions});
    if (error < 0 ||
        functions->awaitReady(opened, std::chrono::steady_clock::now() + timeToConnect) != 0) {
        return false;
    }
    const bool added = std::ranges::all_of(rules, [&](const char* rule) {
        return functions->addMatchAsync(opened, nullptr, rule, leaveIt, leaveIt, nullptr) >= 0;
    });
    descriptor_ = functions->getFd(opened);
    return added && descriptor_ >= 0;
}

bool ManagerSignals::heard() {
    if (!bus_) {
        return false;
    }
    const auto functions = bus_.get_deleter().functions;
    bool announced = false;
    for (;;) {
        sd_bus_message* taken = nullptr;
        const int done = functions->process(bus_.get(), &taken);
        const BusMessage message{taken};
        if (done <= 0) {
            if (done < 0) {
                disconnect();
            }
            return announced || done < 0;
        }
        // The bus itself says when a name was given to this connection, and such things.
        announced =
            announced || (taken != nullptr && functions->isSignal(taken, nullptr, nullptr) > 0 &&
                          functions->isSignal(taken, "org.freedesktop.DBus", nullptr) == 0);
    }
}

}  // namespace ZR::Live

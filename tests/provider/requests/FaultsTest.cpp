// Every function of the broker that a request uses fails once, at each of its calls.

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "FaultEffect.h"
#include "Requests.h"
#include "kit/Files.h"
#include "kit/LogCapture.h"
#include "kit/Tree.h"

namespace {

using test::Fault;
using test::Function;
using test::Host;
using test::Operation;
using test::Outcome;
using test::Request;
using ZR::Testing::LogCapture;

constexpr const char* madeNoObject = "The broker made no object; it is left out of the result";

/// What a failure line may say on these machines, when a call of the broker fails.
const std::set<std::string> knownFailures{
    madeNoObject,
    "Could not obtain an instance of Computer System",
    "Could not obtain an instance of IP Protocol Endpoint",
    "Could not find 'Name' key in Moniker",
    "Could not find 'Name' Key in Moniker",
    "Could not find 'System Name' Key in Moniker",
    "Could not find 'Name' and 'System Name' Key in Moniker",
    "Could not find 'InstanceID' property",
    "Could not find 'InstanceID' Key in Moniker",
    "Could not match the key property for DHCP in Moniker",
    "Could not get 'System Name' and  'Name' key",
    // A key whose text the broker does not give is empty.
    "AssignmentSetting data is not dhcp",
    "Concerned Computer Could Not Be Found.",
    "Concerned DHCP Protocol Endpoint Could Not Be Found.",
    "Concerned IP Protocol Endpoint Could Not Be Found.",
    "Could not get 'Instance ID' key",
    "Could not match 'InstanceID' Key with DHCP instance",
    "Could not match 'System Name' key with 'Name' key in Computer Moniker",
    "Instance ID Property value is not correct",
    "Name Key is not correct.",
};

class FaultsTest : public test::TreeTest {
  protected:
    /// A host with one DHCP interface that has a server and an address, behind others.
    static void setMachine(std::vector<test::Json> interfaces) {
        test::Json eth0 = test::dhcpInterface("eth0", {"192.0.2.1"});
        eth0["properties"]["IPv4Address"] = "192.0.2.10";
        interfaces.push_back(eth0);
        setTree({test::host(interfaces)});
    }

    static std::string fileName() { return dataDirectory() + "ifcfg-eth0"; }

    Outcome outcomeOf(const Request& request) {
        ZR::Testing::writeFile(fileName(), "CONFIG_NAME=old\n");
        log_.clear();
        Outcome outcome{test::run(host_, request), {}, ZR::Testing::readFile(fileName())};
        for (const std::string& message : log_.logMessages()) {
            outcome.failures.push_back(message.substr(message.find("]: ") + 3));
        }
        return outcome;
    }

    /// Lets each call of each function fail in each way, and hands the outcome to
    /// `look(function, fault, call, outcome)`, until the request ends before that call.
    template <typename Look>
    unsigned failEachCall(const Request& request, const Look& look) {
        unsigned failed = 0;
        for (std::size_t i = 0; i < test::functionCount; ++i) {
            const auto function = static_cast<Function>(i);
            for (const Fault fault : {Fault::null, Fault::status}) {
                if (fault == Fault::null && !test::canReturnNull(function)) {
                    continue;
                }
                for (unsigned call = 1;; ++call) {
                    host_.counted().fail(function, call, fault);
                    const Outcome outcome = outcomeOf(request);
                    if (host_.counted().calls(function) < call) {
                        break;
                    }
                    ++failed;
                    look(function, fault, call, outcome);
                }
                host_.counted().failNothing();
            }
        }
        return failed;
    }

    LogCapture log_{6000, 6000};
    Host host_{Host::Neighbours::served, Host::Calls::counted};
};

/// All requests, those of sources without keys, and those that name standard classes.
std::vector<Request> requestsToFail() {
    std::vector<Request> requests = test::allRequests();
    for (const auto& [association, first, second] : test::associationSources()) {
        const std::string keyless = first.substr(0, first.find('.'));
        requests.push_back({Operation::associatorNames, keyless, association});
        requests.push_back({Operation::associators, keyless, association});
        requests.push_back({Operation::referenceNames, keyless, association});
        requests.push_back({Operation::references, keyless, association});
    }
    const std::string endpoint = test::elementSources()[0].path;
    requests.push_back({Operation::associatorNames, endpoint, "CIM_HostedAccessPoint"});
    requests.push_back({Operation::associators, endpoint, "CIM_Dependency"});
    return requests;
}

class AnyRequest : public FaultsTest, public ::testing::WithParamInterface<Request> {};

/// The names' handlers of the association interface are silent about exceptions.
bool tellsOfExceptions(const Request& request) {
    return request.operation != Operation::associatorNames &&
           request.operation != Operation::referenceNames;
}

/// A path whose class cannot be told is of none that is served.
bool hidesTheClass(Function function, unsigned call) {
    return call == 1 && (function == Function::getClassName || function == Function::getCharPtr);
}

/// A standard class is looked up in a namespace; there is none whose name is not told.
bool hidesTheNamespace(const Request& request, Function function, unsigned call) {
    return request.association != nullptr && std::string(request.association).starts_with("CIM_") &&
           call == 1 && (function == Function::getNameSpace || function == Function::getCharPtr);
}

CMPIrc expectedCode(const Request& request, CMPIrc usual, Function function, unsigned call) {
    switch (request.operation) {
        case Operation::enumerateNames:
        case Operation::enumerate:
        case Operation::get:
            return hidesTheClass(function, call) ? CMPI_RC_ERR_INVALID_CLASS : usual;
        case Operation::modify:
            return hidesTheClass(function, call) ? CMPI_RC_ERR_NOT_SUPPORTED : usual;
        case Operation::associators:
            return hidesTheNamespace(request, function, call) ? CMPI_RC_ERR_INVALID_CLASS : usual;
        default:
            return usual;
    }
}

template <typename Object>
std::vector<Object> firstOf(const std::vector<Object>& objects, std::size_t count) {
    return {objects.begin(),
            objects.begin() + static_cast<std::ptrdiff_t>(std::min(count, objects.size()))};
}

TEST_P(AnyRequest, KeepsItsStatusAndWhatWasDeliveredWhateverCallFails) {
    setMachine({test::staticInterface("eth1")});
    const Request& request = GetParam();
    SCOPED_TRACE(request.name());
    const Outcome usual = outcomeOf(request);
    const unsigned failed = failEachCall(
        request, [&](Function function, Fault fault, unsigned call, const Outcome& outcome) {
            SCOPED_TRACE(std::string(test::nameOf(function)) +
                         (fault == Fault::null ? " returns null" : " fails") + " at call " +
                         std::to_string(call));
            EXPECT_EQ(outcome.response.code,
                      expectedCode(request, usual.response.code, function, call));
            EXPECT_FALSE(outcome.response.hasMessage);
            const std::size_t delivered = host_.counted().deliveredBeforeFault();
            EXPECT_EQ(firstOf(outcome.response.paths, delivered),
                      firstOf(usual.response.paths, delivered));
            EXPECT_EQ(firstOf(outcome.response.instances, delivered),
                      firstOf(usual.response.instances, delivered));
            EXPECT_LE(outcome.response.returnDoneCalls, 1U);
            unsigned exceptions = 0;
            for (const std::string& failure : outcome.failures) {
                EXPECT_TRUE(knownFailures.contains(failure)) << failure;
                exceptions += failure == madeNoObject ? 0U : 1U;
            }
            if (!tellsOfExceptions(request)) {
                EXPECT_EQ(exceptions, 0U);
            }
        });
    EXPECT_GT(failed, 0U);
    EXPECT_EQ(test::effectOf(usual, outcomeOf(request)), test::effectOf(usual, usual))
        << "a failure leaves nothing behind";
}

INSTANTIATE_TEST_SUITE_P(All, AnyRequest, ::testing::ValuesIn(requestsToFail()),
                         [](const auto& each) { return each.param.identifier(); });

TEST_F(FaultsTest, RequestsThatAFailureEndsMarkTheirExit) {
    setMachine({});
    const std::string endpoint = test::elementSources()[0].path;
    for (const auto& [operation, handler] :
         {std::pair{Operation::associatorNames, "DHCPClient_AssociatorNames"},
          std::pair{Operation::associators, "DHCPClient_Associators"},
          std::pair{Operation::referenceNames, "DHCPClient_ReferenceNames"},
          std::pair{Operation::references, "DHCPClient_References"}}) {
        const LogCapture flow(4000, 4000);
        host_.counted().fail(Function::enumerateInstances, 1, Fault::status);
        test::run(host_, {operation, endpoint, "QVXZR_HostedDHCPPoint"});
        const auto messages = flow.logMessages();
        ASSERT_GE(messages.size(), 2U);
        EXPECT_THAT(messages[messages.size() - 2],
                    ::testing::StartsWith(std::string("EXITING: ") + handler +
                                          "() in DHCPClientProvider [Line: "));
        EXPECT_EQ(messages.back(), std::string(78, '='));
        // The adapter of the association was destroyed by unwinding.
        EXPECT_EQ(std::count_if(messages.begin(), messages.end(),
                                [](const std::string& message) {
                                    return message.starts_with("METHOD: ~DHCPHostedAccessPoint()");
                                }),
                  1);
    }
}

// What exactly each failing call makes of some requests, literally.

class FaultEffects : public FaultsTest {
  protected:
    /// One line for each function, way of failing and run of calls that have the same
    /// effect. The way is left out where it makes no difference.
    std::string effectsOf(const Request& request) {
        // What a path names is not the first of its kind.
        const bool named = request.path.find('.') != std::string::npos;
        setMachine(named ? std::vector{test::dhcpInterface("aux0")} : std::vector<test::Json>{});
        const Outcome usual = outcomeOf(request);
        std::map<Function, std::vector<std::map<Fault, std::string>>> effects;
        failEachCall(request,
                     [&](Function function, Fault fault, unsigned call, const Outcome& outcome) {
                         auto& ofFunction = effects[function];
                         ofFunction.resize(std::max<std::size_t>(ofFunction.size(), call));
                         ofFunction[call - 1][fault] = test::effectOf(usual, outcome);
                     });
        std::string text = "== " + request.name() + '\n';
        for (const auto& [function, calls] : effects) {
            for (std::size_t first = 0; first < calls.size();) {
                std::size_t last = first;
                while (last + 1 < calls.size() && calls[last + 1] == calls[first]) {
                    ++last;
                }
                text += linesOf(function, first + 1, last + 1, calls[first]);
                first = last + 1;
            }
        }
        return text;
    }

  private:
    static std::string linesOf(Function function, std::size_t first, std::size_t last,
                               const std::map<Fault, std::string>& effects) {
        std::string calls = ' ' + std::to_string(first);
        if (last != first) {
            calls += '-' + std::to_string(last);
        }
        const std::string& failing = effects.at(Fault::status);
        const auto null = effects.find(Fault::null);
        if (null == effects.end() || null->second == failing) {
            return test::nameOf(function) + calls + ": " + failing + '\n';
        }
        return test::nameOf(function) + calls + " null: " + null->second + '\n' +
               test::nameOf(function) + calls + " fails: " + failing + '\n';
    }
};

TEST_F(FaultEffects, AreAsWrittenDown) {
    const auto& elements = test::elementSources();
    const auto& associations = test::associationSources();
    const std::string& endpoint = elements[0].path;
    const std::string& setting = elements[2].path;
    std::string actual;
    for (const Request& request : std::vector<Request>{
             {Operation::enumerateNames, "QVXZR_DHCPProtocolEndpoint"},
             {Operation::enumerate, "QVXZR_DHCPCapabilities"},
             {Operation::get, setting},
             {Operation::modify, setting},
             {Operation::enumerate, "QVXZR_DHCPRemoteServiceAccessPoint"},
             {Operation::associatorNames, endpoint, "QVXZR_HostedDHCPPoint"},
             {Operation::associators, associations[0].first, "QVXZR_HostedDHCPPoint"},
             {Operation::associators, endpoint, "QVXZR_SAPSAPDependency"},
             {Operation::referenceNames, endpoint, "QVXZR_DHCPElementCapabilities"},
             {Operation::references, associations[4].first,
              "QVXZR_DHCPRemoteAccessAvailableToElement"},
             {Operation::references, setting, "QVXZR_DHCPElementSettingData"},
             {Operation::enumerate, "QVXZR_DHCPOrderedComponent"},
             {Operation::associatorNames, endpoint, "CIM_HostedAccessPoint"},
         }) {
        actual += effectsOf(request);
    }
    for (std::size_t at = actual.find(hostName()); at != std::string::npos;
         at = actual.find(hostName(), at)) {
        actual.replace(at, hostName().size(), "@");
    }
    // With UPDATE_EXPECTED=yes in the environment, the file is written instead.
    const std::string expected = ZR_SOURCE_DIR "/tests/provider/requests/faults.expected";
    const char* update = std::getenv("UPDATE_EXPECTED");
    if (update != nullptr && std::string(update) == "yes") {
        ZR::Testing::writeFile(expected, actual);
    }
    EXPECT_EQ(actual, ZR::Testing::readFile(expected));
}

}  // namespace

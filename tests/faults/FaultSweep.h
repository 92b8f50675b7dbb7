#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>

#include "kit/CallOrigin.h"
#include "kit/Files.h"
#include "kit/ProviderHost.h"
#include "kit/Script.h"
#include "kit/TreeMachine.h"

namespace test {

/// Lets one thing go wrong in a request, at each place where it can, one after the
/// other. What must hold of each response: the process lives; the response is complete, or
/// what is missing is missing because of a failure that the log tells of; nothing in it
/// is of a state that is over; a configuration file has its old content or its new one,
/// whole; no descriptor and no memory is lost; and the next request gets the right response.
class FaultSweep {
  public:
    /// Whether the machine changes before each request, so that the request reads it.
    enum class Reads : bool { no, yes };

    FaultSweep(Machine& machine, Reads reads);
    ~FaultSweep();
    FaultSweep(const FaultSweep&) = delete;
    FaultSweep& operator=(const FaultSweep&) = delete;

    /// Each allocation that the provider makes for the request fails once. Returns how
    /// many there were.
    unsigned failAllocations(const ScriptRequest& request);

    /// Each system call that it makes fails with each errno that its manual page tells
    /// of; transfers are of half of the bytes, too. Returns how many failures there were.
    unsigned failSystemCalls(const ScriptRequest& request);

  private:
    /// What is known about a request that meets no failure, in each state.
    struct Usual {
        ScriptResponse response;
        std::int64_t blocks = 0;
    };
    struct Fault {
        std::string what;
        bool misinforms = false;  // says something about the machine that is not so
        bool ofMemory = false;
        bool ofName = false;  // of the machine, which the provider asks for itself, too
    };

    void prepare(const ScriptRequest& request);
    void enterNextState();
    /// False when the request ended without meeting the failure.
    bool failOnce(const ScriptRequest& request, const Fault& fault,
                  const std::function<bool(ScriptResponse&)>& failing);
    void expectTruth(const ScriptRequest& request, const ScriptResponse& response, bool logged,
                     const Fault& fault);
    void expectOneContent();
    ScriptResponse runUndisturbed(const ScriptRequest& request);
    std::int64_t blocksAfter(const ScriptRequest& request);
    std::uintmax_t logSize() const;

    Machine& machine_;
    Reads reads_;
    ZR::Testing::TemporaryDirectory directory_;
    std::string log_ = directory_ / "log";
    std::string data_ = directory_ / "data/";
    std::string configurationFile_ = data_ + "ifcfg-eth0";
    std::unique_ptr<ProviderHost> host_;
    ZR::Testing::CallOrigin origin_;
    unsigned state_ = 0;
    std::array<Usual, 2> usual_;
    std::ptrdiff_t descriptors_ = 0;
};

}  // namespace test

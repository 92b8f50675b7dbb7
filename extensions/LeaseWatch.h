#pragma once

#include <cmpift.h>

#include <condition_variable>
#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "zrclient/InstrumentationService.h"

namespace ZR::DHCPClientExtensions {

/// Tells the object manager what happens to leases, endpoints and interfaces: CIM_InstCreation,
/// CIM_InstModification and CIM_InstDeletion, as clients would see the instances.
///
/// It has one thread while indications are enabled and a filter is active, and none else.
/// Object managers differ in the order and the number of their calls, so that filters are a
/// set and every function may be called again. Safe on any thread, not from within a
/// delivery.
class LeaseWatch {
  public:
    /// That of this library.
    static LeaseWatch& process();

    LeaseWatch() = default;
    /// Where the object manager ends without a cleanup, nothing of it is called any more.
    ~LeaseWatch();
    LeaseWatch(const LeaseWatch&) = delete;
    LeaseWatch& operator=(const LeaseWatch&) = delete;

    /// Call from a function of the provider, with its context. From the return on, what
    /// changes is told. Throw std::exception when the system refuses a thread.
    void activate(const CMPIBroker* broker, const CMPIContext* context, const CMPISelectExp* filter,
                  const std::string& nameSpace);
    void enable(const CMPIBroker* broker, const CMPIContext* context);

    void deactivate(const CMPISelectExp* filter);
    void disable();

    /// Ends the thread and forgets all filters; they may be activated again.
    void end();
    [[nodiscard]] bool running() const;

  private:
    class Round;
    /// What the thread has; it outlives the thread.
    struct Work {
        explicit Work(InstrumentationService& service) : waiter(service) {}

        InstrumentationService::Waiter waiter;
        const CMPIBroker* broker = nullptr;
        const CMPIContext* context = nullptr;  ///< prepared for this thread
        std::mutex mutex;
        std::condition_variable begun;
        std::set<std::string> nameSpaces;
        std::set<std::string> watched;  ///< those whose instances have been seen once
        bool over = false;
        bool abandoned = false;  ///< the object manager is gone
    };

    void adjust(const CMPIBroker* broker, const CMPIContext* context);
    void start(const CMPIBroker* broker, const CMPIContext* context);
    void stop();
    static void run(Work& work);
    static void watch(Work& work);
    [[nodiscard]] std::set<std::string> nameSpaces() const;

    mutable std::mutex mutex_;  ///< never taken by the thread
    bool enabled_ = false;
    std::map<const CMPISelectExp*, std::set<std::string>> filters_;
    std::unique_ptr<Work> work_;
    std::thread thread_;
};

}  // namespace ZR::DHCPClientExtensions

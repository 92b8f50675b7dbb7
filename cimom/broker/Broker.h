#pragma once

#include <cmpift.h>

#include <atomic>
#include <memory>
#include <mutex>
#include <unordered_map>

#include "broker/BrokerMemory.h"
#include "cimom/Forward.h"

namespace cimom::broker {

class IndicationSink;

/// The CMPI broker as one provider library sees it. Its record is what the
/// factories get; it must live until the library's last function returned.
/// Safe for concurrent use.
class Broker {
  public:
    /// Classes, handler and sink must outlive the broker. Without a handler, a provider's
    /// requests to other providers are not supported; without a sink, its indications are not.
    explicit Broker(const ClassRepository& classes, RequestHandler* handler = nullptr,
                    IndicationSink* sink = nullptr) noexcept;
    ~Broker();
    Broker(const Broker&) = delete;
    Broker& operator=(const Broker&) = delete;

    [[nodiscard]] const CMPIBroker* record() const noexcept { return &record_; }
    /// Null for a record that is none of these.
    static Broker* of(const CMPIBroker* record) noexcept;

    [[nodiscard]] const ClassRepository& classes() const noexcept { return *classes_; }
    [[nodiscard]] IndicationSink* sink() const noexcept { return sink_; }

    /// Who is asked, as long as it lives; null without a handler, and after close().
    class Asking {
      public:
        explicit Asking(Broker& broker) noexcept : broker_(broker) { ++broker_.askings_; }
        ~Asking() { --broker_.askings_; }
        Asking(const Asking&) = delete;
        Asking& operator=(const Asking&) = delete;
        [[nodiscard]] RequestHandler* handler() const noexcept { return broker_.handler_.load(); }

      private:
        Broker& broker_;
    };
    [[nodiscard]] MemoryPool& memory() noexcept { return memory_; }

    /// A copy of the context for a thread of the provider; owned by the broker
    /// until the thread detaches. Null for a dead context.
    CMPIContext* prepareThread(const CMPIContext* context);
    /// Attaches the calling thread with a prepared context.
    CMPIrc attachThread(const CMPIContext* context);
    CMPIrc detachThread(const CMPIContext* context);
    /// Whether a thread has attached itself and not detached.
    [[nodiscard]] bool hasThreads();

    /// From here on it asks nobody: for one whose provider has left a thread behind, when who
    /// is asked ends. Waits until no request is under way.
    void close();

  private:
    struct Released {
        void operator()(CMPIContext* context) const noexcept;
    };
    struct Prepared {
        std::unique_ptr<CMPIContext, Released> context;
        unsigned depth;
        unsigned threads;
    };

    const ClassRepository* classes_;
    std::atomic<RequestHandler*> handler_;
    std::atomic<unsigned> askings_{0};
    IndicationSink* sink_;
    CMPIBroker record_;
    MemoryPool memory_;
    std::mutex mutex_;
    std::unordered_map<const CMPIContext*, Prepared> prepared_;
};

extern const CMPIBrokerFT brokerTable;

}  // namespace cimom::broker

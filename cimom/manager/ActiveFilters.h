#pragma once

#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

#include "broker/IndicationSink.h"
#include "cimom/Indications.h"
#include "manager/Providers.h"

namespace cimom {

/// The filters that subscribers have activated: tells the providers of them, and hands out
/// what the providers deliver. No lock is held while both a provider and a subscriber could
/// wait for it: a provider may deliver from inside any of its functions, and may wait for
/// its thread in each.
class ActiveFilters final : public IndicationHub, public broker::IndicationSink {
  public:
    struct Surroundings {
        const ClassRepository& classes;
        const std::vector<std::string>& nameSpaces;
        const std::string& host;
        const std::function<void(const std::string&)>& log;
    };

    /// Borrows all.
    explicit ActiveFilters(const Surroundings& surroundings);
    ~ActiveFilters() override;

    /// A provider of indications of that class. Before any request.
    void serve(const ClassDeclaration& declaration, Provider& provider,
               const std::vector<std::string>& nameSpaces);

    [[nodiscard]] IndicationActivation activate(const IndicationFilter& filter,
                                                IndicationReceiver receiver) override;
    CMPIrc take(const broker::Broker& from, Instance indication) override;

    /// Ends every subscription, and takes nothing any more. While the providers are there.
    void close();

  private:
    class Core;
    class Active;

    std::shared_ptr<Core> core_;
};

}  // namespace cimom

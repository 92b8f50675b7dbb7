#pragma once

#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "http/AddressShares.h"
#include "http/Authenticator.h"
#include "http/Exchange.h"
#include "http/FairQueue.h"
#include "http/TaskPool.h"
#include "operations/Operations.h"
#include "wbem/Metrics.h"
#include "wbem/Pages.h"
#include "wbem/ServerSettings.h"

namespace cimom::wbem {

/// What happens to requests that have arrived: their users are admitted or refused,
/// their operations are carried out, and each gets its response. Safe for concurrent
/// use.
class Dispatcher {
  public:
    /// Borrows all of them. Null for `manager`: requests are for pages.
    Dispatcher(ObjectManager* manager, const PageHandler& pages, const ServerSettings& settings,
               const ServerLog& log, AddressShares& shares, ServerCounts& counts);
    ~Dispatcher();
    Dispatcher(const Dispatcher&) = delete;
    Dispatcher& operator=(const Dispatcher&) = delete;

    /// Whether the head of a request, with users, proves without a long check who sent it.
    [[nodiscard]] bool isRemembered(Exchange& exchange);
    /// Finds out who sent a request that is handed over behind its head, which may take long:
    /// gives it back, or finishes it.
    void authenticate(const SharedExchange& exchange);
    /// Sees to the response to a request that is complete and handed over. With users, its user
    /// is known.
    void dispatch(const SharedExchange& exchange);

    /// Has other users from now on. Only with users.
    void renewUsers(std::vector<User> users) { authenticator_->renew(std::move(users)); }

    /// Runs a short task once the delay is over.
    void runAfter(TaskPool::Clock::duration delay, TaskPool::Task task);
    /// Forgets enumerations that were silent for too long, and replaces workers
    /// whose operation does not return.
    void endOverdue();
    /// Begins nothing more.
    void stop();

  private:
    /// What one check has of its address, until the client has its response.
    class Turn;
    void checkPassword(const SharedExchange& exchange, std::shared_ptr<Turn> turn);
    /// Responds, after a while, that the credentials are wrong, and logs whose.
    void refuse(const SharedExchange& exchange, std::shared_ptr<Turn> turn);
    void runOrRefuse(TaskPool& pool, const SharedExchange& exchange, TaskPool::Task task);
    [[nodiscard]] HttpResponse carryOut(Exchange& exchange, Caller caller);
    /// Carries a request out, in a worker.
    void work(const SharedExchange& exchange, const Caller& caller);

    const PageHandler& pages_;
    const ServerSettings& settings_;
    const ServerLog& log_;
    ServerCounts& counts_;
    AddressShares& shares_;
    std::optional<Operations> operations_;
    std::optional<Authenticator> authenticator_;
    FairQueue checks_;
    // Their tasks use all of the above, and each other's pools: see the destructor.
    TaskPool workers_;
    TaskPool gate_;
    TaskPool timers_;
};

}  // namespace cimom::wbem

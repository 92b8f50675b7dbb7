#pragma once

#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "http/Authenticator.h"
#include "http/Exchange.h"
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
               const ServerLog& log, ServerCounts& counts);

    /// Sees to the response to a request that is complete and handed over.
    void dispatch(const SharedExchange& exchange);
    /// Responds, after a while, that credentials are needed, and logs who had none.
    void refuse(const SharedExchange& exchange, const std::string& who);

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
    void admit(const SharedExchange& exchange, const Identity& identity);
    void checkPassword(const SharedExchange& exchange);
    void runOrRefuse(TaskPool& pool, const SharedExchange& exchange, TaskPool::Task task);
    /// Carries a request out, in a worker.
    void work(const SharedExchange& exchange, const Caller& caller);
    [[nodiscard]] HttpResponse carryOut(const SharedExchange& exchange, const Caller& caller);

    const PageHandler& pages_;
    const ServerSettings& settings_;
    const ServerLog& log_;
    ServerCounts& counts_;
    std::optional<Operations> operations_;
    std::optional<Authenticator> authenticator_;
    // End first, in this order reversed: their tasks use all of the above.
    TaskPool workers_;
    TaskPool gate_;
    TaskPool timers_;
};

}  // namespace cimom::wbem

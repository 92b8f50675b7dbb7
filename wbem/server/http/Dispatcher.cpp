#include "http/Dispatcher.h"

#include <algorithm>
#include <utility>

#include "cimxml/Call.h"
#include "operations/Modification.h"

namespace cimom::wbem {

namespace {

/// What a response takes, of which one piece is in memory and another waits in its spool.
constexpr std::size_t responseMemory = 131072;

}  // namespace

class Dispatcher::Turn {
  public:
    Turn(AddressShares& shares, const AddressKey& key) : shares_(shares), key_(key) {}
    ~Turn() { shares_.endCheck(key_); }
    Turn(const Turn&) = delete;
    Turn& operator=(const Turn&) = delete;

  private:
    AddressShares& shares_;
    const AddressKey key_;
};

Dispatcher::Dispatcher(ObjectManager* manager, const PageHandler& pages,
                       const ServerSettings& settings, const ServerLog& log, AddressShares& shares,
                       ServerCounts& counts)
    : pages_(pages),
      settings_(settings),
      log_(log),
      counts_(counts),
      shares_(shares),
      checks_(settings.limits.waiting),
      workers_(settings.limits.workers, settings.limits.waiting, settings.limits.stuck),
      gate_(1, settings.limits.waiting + 1),
      timers_(1, settings.limits.waiting) {
    if (manager != nullptr) {
        operations_.emplace(*manager, settings.limits, [&log](const Modification& modification) {
            log(LogKind::modification, modificationText(modification));
        });
    }
    if (settings_.users) {
        authenticator_.emplace(*settings_.users);
    }
}

bool Dispatcher::isRemembered(Exchange& exchange) {
    auto identity = authenticator_->remembered(*exchange.headers->authorization);
    if (!identity) {
        return false;
    }
    exchange.setIdentity(*std::move(identity));
    shares_.admitted(exchange.key());
    return true;
}

void Dispatcher::authenticate(const SharedExchange& exchange) {
    if (!shares_.beginCheck(exchange->key())) {
        log_(LogKind::request, exchange->address() + ": too many of its passwords are checked");
        exchange->finish(HttpResponse::failure(http::serviceUnavailable));
        return;
    }
    auto turn = std::make_shared<Turn>(shares_, exchange->key());
    // Checking a password is slow, on purpose: one at a time, so that wrong ones leave the
    // workers to those who have been admitted. Each in the queue has a task of the gate, which
    // takes not that one, but the one whose turn it is.
    if (checks_.push(exchange->key(), shares_.isKnown(exchange->key()),
                     [this, exchange, turn = std::move(turn)]() mutable {
                         checkPassword(exchange, std::move(turn));
                     })) {
        runOrRefuse(gate_, exchange, [this] { checks_.pop()(); });
    } else {
        log_(LogKind::request, exchange->address() + ": too many passwords are checked");
        exchange->finish(HttpResponse::failure(http::serviceUnavailable));
    }
}

void Dispatcher::checkPassword(const SharedExchange& exchange, std::shared_ptr<Turn> turn) {
    if (exchange->isFinished()) {
        return;
    }
    try {
        if (auto identity = authenticator_->check(*exchange->headers->authorization)) {
            shares_.admitted(exchange->key());
            // Before the client can send the next one, which may need the turn.
            turn.reset();
            exchange->giveBack(*std::move(identity));
        } else {
            refuse(exchange, std::move(turn));
        }
    } catch (const std::exception& error) {
        log_(LogKind::failure, error.what());
        exchange->finish(HttpResponse::failure(http::serverFault));
    }
}

void Dispatcher::refuse(const SharedExchange& exchange, std::shared_ptr<Turn> turn) {
    shares_.refused(exchange->key());
    counts_.credentialsRefused();
    log_(LogKind::refusal, "refused " +
                               authenticator_->claimedUser(*exchange->headers->authorization) +
                               " from " + exchange->address() + ", refusal number " +
                               std::to_string(authenticator_->countRefusal()));
    if (!timers_.runAfter(settings_.refusalDelay, [exchange, turn = std::move(turn)]() mutable {
            turn.reset();
            exchange->finish(HttpResponse::refusal());
        })) {
        exchange->finish(HttpResponse::failure(http::serviceUnavailable));
    }
}

void Dispatcher::dispatch(const SharedExchange& exchange) {
    Caller caller{std::nullopt, exchange->address(), !settings_.readOnly};
    if (const auto identity = exchange->identity()) {
        caller.user = identity->name;
        caller.mayModify = caller.mayModify && identity->role == Role::modify;
    } else {
        shares_.admitted(exchange->key());
    }
    runOrRefuse(workers_, exchange, [this, exchange, caller] { work(exchange, caller); });
}

void Dispatcher::runOrRefuse(TaskPool& pool, const SharedExchange& exchange, TaskPool::Task task) {
    if (!pool.run(std::move(task))) {
        log_(LogKind::failure, "too many requests wait for a worker, or no worker comes back");
        exchange->finish(HttpResponse::failure(http::serviceUnavailable));
    }
}

void Dispatcher::runAfter(TaskPool::Clock::duration delay, TaskPool::Task task) {
    // Once stopped, the server ends: nothing needs to be done any more.
    static_cast<void>(timers_.runAfter(delay, std::move(task)));
}

void Dispatcher::endOverdue() {
    if (operations_) {
        operations_->sessions().expire();
    }
    const std::size_t replaced = workers_.replaceStuck(settings_.limits.request);
    if (replaced > 0) {
        log_(LogKind::failure, std::to_string(replaced) +
                                   " operations have not returned in their time; other workers "
                                   "take the place of theirs");
    }
}

Dispatcher::~Dispatcher() {
    // None of them goes before the tasks of all have ended.
    timers_.end();
    gate_.end();
    workers_.end();
}

void Dispatcher::stop() {
    timers_.stop();
    gate_.stop();
    workers_.stop();
}

HttpResponse Dispatcher::carryOut(Exchange& exchange, Caller caller) {
    if (!operations_) {
        return HttpResponse::of(pages_(*exchange.page));
    }
    const std::size_t most = usualMemory(exchange.body.size());
    if (!exchange.memory.growTo(exchange.memory.size() + std::max(most, responseMemory))) {
        throw HttpFailure(http::serviceUnavailable, "", "no memory for the request");
    }
    const Call call = readCall(exchange.body, settings_.limits.depth, most);
    checkAgreement(*exchange.headers, call);
    exchange.body = std::string();
    exchange.memory.shrinkTo(std::max(most, responseMemory));
    caller.gone = [&exchange] { return exchange.isFinished(); };
    const auto start = Exchange::Clock::now();
    ResponseBody body = operations_->perform(call, caller);
    counts_.operationDone(Operations::nameOf(call), body.status(), Exchange::Clock::now() - start);
    return HttpResponse::of(std::move(body));
}

void Dispatcher::work(const SharedExchange& exchange, const Caller& caller) {
    if (exchange->isFinished()) {
        // Its time was over before a worker came: the client has been told that
        // nothing was done.
        return;
    }
    try {
        HttpResponse response = carryOut(*exchange, caller);
        exchange->memory.shrinkTo(responseMemory);
        exchange->finish(std::move(response));
    } catch (const HttpFailure& failure) {
        log_(LogKind::request, exchange->address() + ": " + failure.what());
        exchange->finish(HttpResponse::failure(failure));
    } catch (const NotValid& error) {
        log_(LogKind::request, exchange->address() + ": " + error.what());
        exchange->finish(HttpResponse::failure(http::badRequest, "request-not-valid"));
    } catch (const std::exception& error) {
        log_(LogKind::failure, error.what());
        exchange->finish(HttpResponse::failure(http::serverFault));
    }
}

}  // namespace cimom::wbem

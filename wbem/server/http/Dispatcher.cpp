#include "http/Dispatcher.h"

#include <utility>

#include "cimxml/Call.h"
#include "operations/Modification.h"

namespace cimom::wbem {

Dispatcher::Dispatcher(ObjectManager* manager, const PageHandler& pages,
                       const ServerSettings& settings, const ServerLog& log, ServerCounts& counts)
    : pages_(pages),
      settings_(settings),
      log_(log),
      counts_(counts),
      workers_(settings.limits.workers, settings.limits.waiting, settings.limits.stuck),
      gate_(1, settings.limits.waiting),
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

void Dispatcher::dispatch(const SharedExchange& exchange) {
    if (!authenticator_) {
        const Caller caller{std::nullopt, exchange->address(), !settings_.readOnly};
        runOrRefuse(workers_, exchange, [this, exchange, caller] { work(exchange, caller); });
        return;
    }
    if (auto identity = authenticator_->remembered(*exchange->headers->authorization)) {
        admit(exchange, *identity);
        return;
    }
    // Checking a password is slow, on purpose: one at a time, so that wrong ones
    // leave the workers to those who have been admitted.
    runOrRefuse(gate_, exchange, [this, exchange] { checkPassword(exchange); });
}

void Dispatcher::checkPassword(const SharedExchange& exchange) {
    const std::string& authorization = *exchange->headers->authorization;
    try {
        if (const auto identity = authenticator_->check(authorization)) {
            admit(exchange, *identity);
        } else {
            refuse(exchange, authenticator_->claimedUser(authorization));
        }
    } catch (const std::exception& error) {
        log_(LogKind::failure, error.what());
        exchange->finish(HttpResponse::failure(http::serverFault));
    }
}

void Dispatcher::admit(const SharedExchange& exchange, const Identity& identity) {
    const Caller caller{identity.name, exchange->address(),
                        identity.role == Role::modify && !settings_.readOnly};
    runOrRefuse(workers_, exchange, [this, exchange, caller] { work(exchange, caller); });
}

void Dispatcher::runOrRefuse(TaskPool& pool, const SharedExchange& exchange, TaskPool::Task task) {
    if (!pool.run(std::move(task))) {
        log_(LogKind::failure, "too many requests wait for a worker, or no worker comes back");
        exchange->finish(HttpResponse::failure(http::serviceUnavailable));
    }
}

void Dispatcher::refuse(const SharedExchange& exchange, const std::string& who) {
    counts_.credentialsRefused();
    log_(LogKind::refusal, "refused " + who + " from " + exchange->address() + ", refusal number " +
                               std::to_string(authenticator_->countRefusal()));
    if (!timers_.runAfter(settings_.refusalDelay,
                          [exchange] { exchange->finish(HttpResponse::refusal()); })) {
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

void Dispatcher::stop() {
    timers_.stop();
    gate_.stop();
    workers_.stop();
}

HttpResponse Dispatcher::carryOut(const SharedExchange& exchange, const Caller& caller) {
    if (!operations_) {
        return HttpResponse::of(pages_(*exchange->page));
    }
    const Call call = readCall(exchange->body, settings_.limits.depth);
    checkAgreement(*exchange->headers, call);
    Caller asking = caller;
    asking.gone = [&exchange] { return exchange->isFinished(); };
    const auto start = Exchange::Clock::now();
    ResponseBody body = operations_->perform(call, asking);
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
        exchange->finish(carryOut(exchange, caller));
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

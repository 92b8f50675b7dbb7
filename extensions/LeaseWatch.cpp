#include "LeaseWatch.h"

#include <pthread.h>
#include <unistd.h>
#include <csignal>

#include <array>
#include <atomic>
#include <chrono>
#include <exception>
#include <stdexcept>
#include <utility>

#include "ObservedInstances.h"
#include "tklogger/TKLogger.h"
#include "zrclient/OneMoment.h"
#include "zrcommon/LogLevel.h"
#include "zrcommon/SystemName.h"

namespace ZR::DHCPClientExtensions {

namespace {

// An interface without a lease, and an address that is of no lease, show in the last one alone.
constexpr std::array watchedClasses{"QVXZR_DHCPLease", "QVXZR_DHCPProtocolEndpoint",
                                    "QVXZR_DHCPInterface"};

/// How long a function of the provider waits until what there is has been seen, so that
/// everything later is told.
constexpr std::chrono::seconds firstSight{2};
/// How long a library that is unloaded without a cleanup waits for its thread.
constexpr std::chrono::seconds lastWait{1};

/// What fails at once, as for want of memory, is not tried again all the time.
constexpr std::chrono::milliseconds afterFailure{200};

void logFailure(const char* text) {
    TKLog::TKLogger::logLevelMessage("extensions/LeaseWatch", "watch", __LINE__, "ZR.Extensions",
                                     LogLevel::failure, nullptr, 0, 0, text);
}

/// Differs from that of every other indication of this machine.
std::string newIdentifier() {
    static const std::string start =
        "QVXZR:" + std::to_string(::getpid()) + '-' +
        std::to_string(std::chrono::system_clock::now().time_since_epoch().count()) + '-';
    static std::atomic<unsigned long long> number = 0;
    return start + std::to_string(++number);
}

/// What is made on this thread ends with the round, where the object manager can do that.
class ObjectsOfRound {
  public:
    explicit ObjectsOfRound(const CMPIBroker* broker) : broker_(broker) {
        if (broker_->mft != nullptr && broker_->mft->mark != nullptr) {
            CMPIStatus status{CMPI_RC_OK, nullptr};
            mark_ = broker_->mft->mark(broker_, &status);
        }
    }
    ~ObjectsOfRound() {
        if (mark_ != nullptr) {
            static_cast<void>(broker_->mft->release(broker_, mark_));
        }
    }
    ObjectsOfRound(const ObjectsOfRound&) = delete;
    ObjectsOfRound& operator=(const ObjectsOfRound&) = delete;

  private:
    const CMPIBroker* broker_;
    CMPIGcStat* mark_ = nullptr;
};

}  // namespace

/// One look at the instances of a namespace, and the indications about it.
class LeaseWatch::Round {
  public:
    Round(const Work& work, const std::string& nameSpace) : work_(work), nameSpace_(nameSpace) {}

    void look(const char* className, ObservedInstances& observed) {
        const CMPIBroker* const broker = work_.broker;
        CMPIStatus status{CMPI_RC_OK, nullptr};
        const CMPIObjectPath* const path =
            broker->eft->newObjectPath(broker, nameSpace_.c_str(), className, &status);
        if (path == nullptr) {
            return;
        }
        CMPIEnumeration* const instances =
            broker->bft->enumerateInstances(broker, work_.context, path, nullptr, &status);
        if (instances == nullptr || status.rc != CMPI_RC_OK) {
            // What cannot be asked for has not gone.
            return;
        }
        std::vector<const CMPIInstance*> now;
        while (instances->ft->hasNext(instances, nullptr) != 0) {
            const CMPIData each = instances->ft->getNext(instances, &status);
            if (status.rc != CMPI_RC_OK) {
                return;
            }
            if (each.type == CMPI_instance && each.value.inst != nullptr) {
                now.push_back(each.value.inst);
            }
        }
        observed.see(now, [this](const Difference& difference) { tell(difference); });
    }

  private:
    void tell(const Difference& difference) {
        const char* const className = difference.before == nullptr  ? "CIM_InstCreation"
                                      : difference.after == nullptr ? "CIM_InstDeletion"
                                                                    : "CIM_InstModification";
        const CMPIBroker* const broker = work_.broker;
        const CMPIObjectPath* const path =
            broker->eft->newObjectPath(broker, nameSpace_.c_str(), className, nullptr);
        CMPIInstance* const indication =
            path == nullptr ? nullptr : broker->eft->newInstance(broker, path, nullptr);
        if (indication == nullptr) {
            throw std::runtime_error("the object manager makes no indication");
        }
        const CMPIInstance* const source =
            difference.after == nullptr ? difference.before : difference.after;
        set(indication, "SourceInstance", source);
        if (difference.before != nullptr && difference.after != nullptr) {
            set(indication, "PreviousInstance", difference.before);
        }
        set(indication, "SourceInstanceModelPath", nameSpace_ + ':' + *difference.path);
        set(indication, "SourceInstanceHost", getSystemName());
        set(indication, "IndicationIdentifier", newIdentifier());
        CMPIValue time;
        time.dateTime = broker->eft->newDateTime(broker, nullptr);
        if (time.dateTime != nullptr) {
            indication->ft->setProperty(indication, "IndicationTime", &time, CMPI_dateTime);
        }
        // It is refused when no filter is active any more, and then nobody misses it.
        static_cast<void>(
            broker->bft->deliverIndication(broker, work_.context, nameSpace_.c_str(), indication));
    }

    static void set(CMPIInstance* indication, const char* name, const CMPIInstance* instance) {
        CMPIValue value;
        // The object manager copies it; the table has no place for a constant one.
        value.inst = const_cast<CMPIInstance*>(instance);  // NOLINT(*-const-cast)
        const CMPIStatus status =
            indication->ft->setProperty(indication, name, &value, CMPI_instance);
        if (status.rc != CMPI_RC_OK) {
            throw std::runtime_error(std::string("the object manager refuses ") + name);
        }
    }

    void set(CMPIInstance* indication, const char* name, const std::string& text) const {
        CMPIValue value;
        value.string = work_.broker->eft->newString(work_.broker, text.c_str(), nullptr);
        if (value.string != nullptr && !text.empty()) {
            indication->ft->setProperty(indication, name, &value, CMPI_string);
        }
    }

    const Work& work_;
    const std::string& nameSpace_;
};

LeaseWatch& LeaseWatch::process() {
    // Made after the service, so that the thread has ended when that ends.
    static_cast<void>(InstrumentationService::process());
    static LeaseWatch watch;
    return watch;
}

LeaseWatch::~LeaseWatch() {
    if (!work_) {
        return;
    }
    bool over = false;
    {
        std::unique_lock lock(work_->mutex);
        work_->abandoned = true;
        work_->waiter.stop();
        over = work_->begun.wait_for(lock, lastWait, [this] { return work_->over; });
    }
    if (over) {
        thread_.join();
    } else {
        // It hangs in the object manager, which is being ended, and may still use this.
        thread_.detach();
        static_cast<void>(work_.release());
    }
}

void LeaseWatch::activate(const CMPIBroker* broker, const CMPIContext* context,
                          const CMPISelectExp* filter, const std::string& nameSpace) {
    const std::lock_guard lock(mutex_);
    filters_[filter].insert(nameSpace);
    try {
        adjust(broker, context);
    } catch (...) {
        filters_.erase(filter);
        throw;
    }
}

void LeaseWatch::enable(const CMPIBroker* broker, const CMPIContext* context) {
    const std::lock_guard lock(mutex_);
    enabled_ = true;
    adjust(broker, context);
}

void LeaseWatch::deactivate(const CMPISelectExp* filter) {
    const std::lock_guard lock(mutex_);
    filters_.erase(filter);
    adjust(nullptr, nullptr);
}

void LeaseWatch::disable() {
    const std::lock_guard lock(mutex_);
    enabled_ = false;
    adjust(nullptr, nullptr);
}

void LeaseWatch::end() {
    const std::lock_guard lock(mutex_);
    filters_.clear();
    enabled_ = false;
    stop();
}

bool LeaseWatch::running() const {
    const std::lock_guard lock(mutex_);
    return work_ != nullptr;
}

std::set<std::string> LeaseWatch::nameSpaces() const {
    std::set<std::string> all;
    for (const auto& [filter, of] : filters_) {
        all.insert(of.begin(), of.end());
    }
    return all;
}

/// Starts or ends the thread, or tells it what else to watch.
void LeaseWatch::adjust(const CMPIBroker* broker, const CMPIContext* context) {
    if (!enabled_ || filters_.empty()) {
        stop();
        return;
    }
    if (!work_) {
        if (broker == nullptr) {
            return;
        }
        start(broker, context);
    }
    std::unique_lock lock(work_->mutex);
    const std::set<std::string> wanted = nameSpaces();
    if (wanted != work_->nameSpaces) {
        work_->nameSpaces = wanted;
        work_->waiter.refresh();
    }
    work_->begun.wait_for(lock, firstSight,
                          [&] { return work_->over || work_->watched == work_->nameSpaces; });
}

void LeaseWatch::start(const CMPIBroker* broker, const CMPIContext* context) {
    auto work = std::make_unique<Work>(InstrumentationService::process());
    work->broker = broker;
    work->nameSpaces = nameSpaces();
    work->context = broker->bft->prepareAttachThread(broker, context);
    if (work->context == nullptr) {
        throw std::runtime_error("the object manager prepares no thread");
    }
    // Signals are for the threads of the object manager.
    sigset_t all;
    sigset_t before;
    sigfillset(&all);
    pthread_sigmask(SIG_SETMASK, &all, &before);
    try {
        thread_ = std::thread([&task = *work] { run(task); });
    } catch (...) {
        pthread_sigmask(SIG_SETMASK, &before, nullptr);
        throw;
    }
    pthread_sigmask(SIG_SETMASK, &before, nullptr);
    work_ = std::move(work);
}

void LeaseWatch::stop() {
    if (work_) {
        work_->waiter.stop();
        thread_.join();
        work_.reset();
    }
}

void LeaseWatch::run(Work& work) {
    if (work.broker->bft->attachThread(work.broker, work.context).rc == CMPI_RC_OK) {
        watch(work);
        bool abandoned = false;
        {
            const std::lock_guard lock(work.mutex);
            abandoned = work.abandoned;
        }
        if (!abandoned) {
            static_cast<void>(work.broker->bft->detachThread(work.broker, work.context));
        }
    } else {
        logFailure("the object manager does not know the thread that watches leases");
    }
    const std::lock_guard lock(work.mutex);
    work.over = true;
    work.begun.notify_all();
}

void LeaseWatch::watch(Work& work) {
    using OfNameSpace = std::array<ObservedInstances, watchedClasses.size()>;
    // Not released when the object manager is gone: its functions may not be called then.
    auto observed = std::make_unique<std::map<std::string, OfNameSpace>>();
    std::shared_ptr<const Snapshot> known;
    while (true) {
        try {
            known = work.waiter.next(known);
            if (!known) {
                break;
            }
            std::set<std::string> wanted;
            {
                const std::lock_guard lock(work.mutex);
                wanted = work.nameSpaces;
            }
            std::erase_if(*observed,
                          [&](const auto& each) { return !wanted.contains(each.first); });
            {
                const ObjectsOfRound objects(work.broker);
                // All that is compared is of one moment, where the providers are in this process.
                const OneMoment moment;
                known = OneMoment::current();
                for (const std::string& nameSpace : wanted) {
                    OfNameSpace& here = (*observed)[nameSpace];
                    for (std::size_t index = 0; index < here.size(); ++index) {
                        Round(work, nameSpace).look(watchedClasses.at(index), here.at(index));
                    }
                }
            }
            const std::lock_guard lock(work.mutex);
            work.watched = std::move(wanted);
            work.begun.notify_all();
        } catch (const std::exception& exception) {
            // What was not told is told when something changes next.
            logFailure(exception.what());
            std::this_thread::sleep_for(afterFailure);
        }
    }
    const std::lock_guard lock(work.mutex);
    if (work.abandoned) {
        static_cast<void>(observed.release());
    }
}

}  // namespace ZR::DHCPClientExtensions

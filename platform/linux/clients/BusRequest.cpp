#include "clients/BusRequest.h"

#include <algorithm>
#include <cerrno>
#include <nlohmann/json.hpp>
#include <string_view>
#include <utility>

#include "formats/Files.h"

namespace ZR::Live {
namespace {

using Json = nlohmann::json;

/// Frees what a failed call leaves.
class BusError {
  public:
    BusError() = default;
    BusError(const BusError&) = delete;
    BusError& operator=(const BusError&) = delete;
    ~BusError() { SdBus::get()->errorFree(&error_); }

    sd_bus_error* get() noexcept { return &error_; }
    /// Whether what was asked for is not there, which is no failure.
    [[nodiscard]] bool tellsOfAbsence(const char* own) const noexcept {
        const auto is = [this](const char* name) {
            return SdBus::get()->errorHasName(&error_, name) != 0;
        };
        return (own != nullptr && is(own)) || is(SD_BUS_ERROR_SERVICE_UNKNOWN) ||
               is(SD_BUS_ERROR_NAME_HAS_NO_OWNER) || is(SD_BUS_ERROR_UNKNOWN_METHOD) ||
               is(SD_BUS_ERROR_UNKNOWN_OBJECT) || is(SD_BUS_ERROR_UNKNOWN_INTERFACE);
    }

  private:
    sd_bus_error error_{};
};

/// Makes JSON of what is in a message. The library has checked its form.
class MessageReader {
  public:
    explicit MessageReader(sd_bus_message* message) : message_(message) {}

    /// The next value; nullopt behind the last one, or, with error() set, when it cannot be
    /// read.
    std::optional<Json> next() {
        char type = 0;
        const char* contents = nullptr;
        const int peeked = functions_->peekType(message_, &type, &contents);
        if (peeked <= 0) {
            note(peeked);
            return std::nullopt;
        }
        switch (type) {
            case SD_BUS_TYPE_ARRAY:
                return contents != nullptr && *contents == SD_BUS_TYPE_DICT_ENTRY_BEGIN
                           ? object(contents)
                           : list(type, contents);
            case SD_BUS_TYPE_STRUCT:
                return list(type, contents);
            case SD_BUS_TYPE_VARIANT:
                return variant(contents);
            default:
                return basic(type);
        }
    }

    [[nodiscard]] int error() const noexcept { return error_; }

  private:
    bool note(int result) {
        if (result < 0 && error_ == 0) {
            error_ = -result;
        }
        return result >= 0;
    }
    bool enter(char type, const char* contents) {
        return note(functions_->enterContainer(message_, type, contents));
    }
    void leave() {
        if (error_ == 0) {
            note(functions_->exitContainer(message_));
        }
    }

    std::optional<Json> list(char type, const char* contents) {
        Json values = Json::array();
        if (!enter(type, contents)) {
            return std::nullopt;
        }
        while (auto value = next()) {
            values.push_back(*std::move(value));
        }
        leave();
        return error_ == 0 ? std::optional{std::move(values)} : std::nullopt;
    }

    /// `contents`: the type of an entry with its braces.
    std::optional<Json> object(const char* contents) {
        Json members = Json::object();
        const std::string_view whole{contents};
        const std::string entry{whole.substr(1, whole.size() - 2)};
        if (!enter(SD_BUS_TYPE_ARRAY, contents)) {
            return std::nullopt;
        }
        int entered = 0;
        while ((entered = functions_->enterContainer(message_, SD_BUS_TYPE_DICT_ENTRY,
                                                     entry.c_str())) > 0) {
            const auto key = next();
            auto value = key ? next() : std::nullopt;
            if (!value) {
                return std::nullopt;
            }
            members[key->is_string() ? key->get<std::string>() : key->dump()] = *std::move(value);
            leave();
        }
        note(entered);
        leave();
        return error_ == 0 ? std::optional{std::move(members)} : std::nullopt;
    }

    std::optional<Json> variant(const char* contents) {
        if (!enter(SD_BUS_TYPE_VARIANT, contents)) {
            return std::nullopt;
        }
        auto value = next();
        leave();
        return value;
    }

    template <typename Number>
    std::optional<Json> number(char type) {
        Number value{};
        return note(functions_->readBasic(message_, type, &value)) ? std::optional{Json(value)}
                                                                   : std::nullopt;
    }

    std::optional<Json> basic(char type) {
        switch (type) {
            case SD_BUS_TYPE_BYTE:
                return number<std::uint8_t>(type);
            case SD_BUS_TYPE_INT16:
                return number<std::int16_t>(type);
            case SD_BUS_TYPE_UINT16:
                return number<std::uint16_t>(type);
            case SD_BUS_TYPE_INT32:
                return number<std::int32_t>(type);
            case SD_BUS_TYPE_UINT32:
                return number<std::uint32_t>(type);
            case SD_BUS_TYPE_INT64:
                return number<std::int64_t>(type);
            case SD_BUS_TYPE_UINT64:
                return number<std::uint64_t>(type);
            case SD_BUS_TYPE_DOUBLE:
                return number<double>(type);
            case SD_BUS_TYPE_BOOLEAN: {
                int value = 0;
                return note(functions_->readBasic(message_, type, &value))
                           ? std::optional{Json(value != 0)}
                           : std::nullopt;
            }
            case SD_BUS_TYPE_STRING:
            case SD_BUS_TYPE_OBJECT_PATH:
            case SD_BUS_TYPE_SIGNATURE: {
                const char* text = nullptr;
                return note(functions_->readBasic(message_, type, &text))
                           ? std::optional{Json(text)}
                           : std::nullopt;
            }
            default:  // a descriptor of a file, which nothing here asks for
                note(-ENOTSUP);
                return std::nullopt;
        }
    }

    std::shared_ptr<const SdBus> functions_ = SdBus::get();
    sd_bus_message* message_;
    int error_ = 0;
};

}  // namespace

BusRequests::BusRequests(const char* program, const char* service, Deadline deadline)
    : program_(program), service_(service), deadline_(deadline), functions_(SdBus::get()) {
    if (functions_->missing().empty()) {
        open();
    } else {
        fail(functions_->missing());
    }
}

BusRequests::~BusRequests() = default;

void BusRequests::open() {
    sd_bus* opened = nullptr;
    const int error = functions_->openSystem(&opened);
    bus_ = BusConnection(opened, CloseBus{functions_});
    if (error < 0) {
        bus_.reset();
        // Many a machine has such a program and no bus.
        if (error != -ENOENT && error != -ECONNREFUSED) {
            fail(-error);
        }
        return;
    }
    if (const int late = functions_->awaitReady(bus_.get(), deadline_); late != 0) {
        fail(late);
    }
}

void BusRequests::fail(const std::string& reason) {
    failure_ = std::string{program_} + " cannot be asked: " + reason;
    bus_.reset();
}

void BusRequests::fail(int error) {
    fail(reasonOf(error));
}

std::optional<Json> BusRequests::call(const BusMethod& method) {
    if (!bus_) {
        return std::nullopt;
    }
    sd_bus_message* made = nullptr;
    int done = functions_->newMethodCall(bus_.get(), &made, service_, method.path.c_str(),
                                         method.interface, method.name);
    const BusMessage request{made};
    if (done >= 0 && method.argument) {
        done = functions_->appendBasic(request.get(), SD_BUS_TYPE_UINT32, &*method.argument);
    }
    if (done >= 0) {
        done = functions_->setAutoStart(request.get(), 0);
    }
    if (done < 0) {
        fail(-done);
        return std::nullopt;
    }
    BusError error;
    sd_bus_message* responded = nullptr;
    // A timeout of 0 would mean the library's own of 25 seconds.
    const int call = functions_->call(bus_.get(), request.get(),
                                      std::max<std::uint64_t>(microsecondsTo(deadline_), 1),
                                      error.get(), &responded);
    const BusMessage response{responded};
    if (call < 0) {
        if (!error.tellsOfAbsence(method.nothing)) {
            fail(-call);
        }
        return std::nullopt;
    }
    MessageReader reader{response.get()};
    auto value = reader.next();
    if (reader.error() != 0) {
        fail(reader.error());
        return std::nullopt;
    }
    return value;
}

}  // namespace ZR::Live

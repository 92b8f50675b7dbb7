#pragma once

#include "Completion.h"
#include "Providers.h"

namespace ZR::DHCPClientGateway {

/// Hands objects to the result of a request, in the form that the request wants.
class Delivery {
  public:
    /// Of names.
    explicit Delivery(const Request& request) : request_(request) {}
    /// Of instances, with what a property list has; null: all properties.
    Delivery(const Request& request, const char** properties)
        : request_(request), form_(Form::instances), properties_(properties) {}

    [[nodiscard]] Form form() const noexcept { return form_; }

    /// Of a name the path counts, of an instance just that. An object manager that has given up on
    /// the request refuses: the walks are short enough to end by themselves. Throws Refusal.
    void give(const ServedClass& served, const Object& object) const {
        const CMPIResult* result = request_.result;
        if (form_ == Form::names) {
            static_cast<void>(result->ft->returnObjectPath(result, object.path));
        } else {
            static_cast<void>(result->ft->returnInstance(
                result, completed(request_, served, object.instance, properties_)));
        }
    }

  private:
    const Request& request_;
    Form form_ = Form::names;
    const char** properties_ = nullptr;
};

}  // namespace ZR::DHCPClientGateway

#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "cimom/Forward.h"

namespace cimom::wbem {

/// The message that asks for an intrinsic operation (DSP0201, 5.6), as a client
/// writes it.
class OperationRequest {
  public:
    /// `nameSpace` without a leading slash.
    OperationRequest(std::string method, std::string nameSpace);

    [[nodiscard]] const std::string& method() const noexcept { return method_; }
    [[nodiscard]] const std::string& nameSpace() const noexcept { return nameSpace_; }

    // Parameters. One that is absent is null, and not written.
    OperationRequest& flag(const char* name, bool value);
    OperationRequest& text(const char* name, const std::optional<std::string>& value);
    OperationRequest& texts(const char* name,
                            const std::optional<std::vector<std::string>>& values);
    OperationRequest& className(const char* name, const std::optional<std::string>& value);
    /// INSTANCENAME: without the namespace, which is the request's own.
    OperationRequest& instanceName(const char* name, const ObjectPath& path);
    /// INSTANCE.
    OperationRequest& instance(const char* name, const Instance& value);
    /// VALUE.NAMEDINSTANCE.
    OperationRequest& namedInstance(const char* name, const Instance& instance);

    /// The whole message.
    [[nodiscard]] std::string body() const;
    /// What the header CIMObject names: the namespace, percent-encoded (DSP0200, 7.2).
    [[nodiscard]] std::string objectHeader() const;

  private:
    void parameter(const char* name, std::string_view value);

    std::string method_;
    std::string nameSpace_;
    std::string parameters_;
};

}  // namespace cimom::wbem

#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "cimom/Instance.h"
#include "cimxml/Call.h"

namespace cimom::wbem {

/// The parameters of one intrinsic operation. Names compare without regard to
/// case; null is as good as absent. All functions throw CimError with
/// invalidParameter for a value of another kind, and NotValid for one that is
/// none at all.
class Parameters {
  public:
    /// Borrows the call. Throws CimError when a parameter is given twice.
    explicit Parameters(const Call& call);

    [[nodiscard]] bool flag(const char* name, bool standard);
    [[nodiscard]] std::optional<std::string> text(const char* name);
    [[nodiscard]] std::optional<std::vector<std::string>> texts(const char* name);
    [[nodiscard]] std::optional<std::uint32_t> number(const char* name);
    [[nodiscard]] std::optional<std::string> className(const char* name);
    [[nodiscard]] std::string requiredText(const char* name);
    [[nodiscard]] std::uint32_t requiredNumber(const char* name);
    [[nodiscard]] std::string requiredClassName(const char* name);
    [[nodiscard]] ObjectPath requiredInstanceName(const char* name);
    /// INSTANCENAME, or CLASSNAME for the class itself.
    struct ObjectName {
        ObjectPath path;
        bool isClass = false;
    };
    [[nodiscard]] ObjectName requiredObjectName(const char* name);
    /// INSTANCE; its path holds the class alone.
    [[nodiscard]] Instance requiredInstance(const char* name);
    /// VALUE.NAMEDINSTANCE; the instance has the path of the INSTANCENAME. Throws
    /// CimError when the two disagree about the class.
    [[nodiscard]] Instance requiredNamedInstance(const char* name);

    /// Throws CimError when there is a parameter that was not read.
    void finish() const;

  private:
    struct Entry {
        const Parameter* parameter = nullptr;
        bool used = false;
    };

    /// The value; null when there is none.
    const XmlElement* value(const char* name);
    /// The value, which must be of that element; null when there is none.
    const XmlElement* valueOf(const char* name, const char* element);
    const XmlElement& required(const char* name, const XmlElement* value) const;

    std::vector<Entry> entries_;
};

}  // namespace cimom::wbem

#include "cimom/Interop.h"

#include <algorithm>
#include <functional>
#include <iterator>
#include <memory>
#include <utility>

#include "cimom/Instance.h"
#include "cimom/Names.h"
#include "cimom/ObjectManager.h"
#include "cimom/OwnClass.h"

namespace cimom {

namespace {

constexpr const char* managerClass = "CIM_ObjectManager";
constexpr const char* nameSpaceClass = "CIM_Namespace";
constexpr const char* mechanismClass = "CIM_ObjectManagerCommunicationMechanism";

Value numberOf(std::uint16_t number) {
    return {Type::uint16, false, Scalar(std::uint64_t{number})};
}

Value numbersOf(const std::vector<std::uint16_t>& numbers) {
    Array elements;
    for (const std::uint16_t number : numbers) {
        elements.emplace_back(std::uint64_t{number});
    }
    return {Type::uint16, true, std::move(elements)};
}

Value flagOf(bool flag) {
    return {Type::boolean, false, Scalar(flag)};
}

Value referenceTo(const ObjectPath& path) {
    return {Type::reference, false, Scalar(std::make_shared<const ObjectPath>(path))};
}

NamedValue text(std::string name, std::string content) {
    return {std::move(name), Value::ofString(std::move(content))};
}

/// An instance whose keys are among its properties, too.
Instance instanceOf(const std::string& className, std::vector<NamedValue> keys,
                    std::vector<NamedValue> further) {
    Instance made{{"", std::string(interopNameSpace), className, std::move(keys)}, {}};
    made.properties = made.path.keys;
    std::ranges::move(further, std::back_inserter(made.properties));
    return made;
}

/// A class whose instances a function makes anew for each request.
class ListedClass final : public OwnClass {
  public:
    using List = std::function<std::vector<Instance>()>;

    ListedClass(std::string className, List list)
        : OwnClass(std::move(className), {std::string(interopNameSpace)}), list_(std::move(list)) {}

    [[nodiscard]] std::vector<Instance> instances(const std::string& /*nameSpace*/) const override {
        return list_();
    }

  private:
    const List list_;
};

/// The namespaces below the one that is asked, by which clients of old go down from one to
/// the next.
class NameSpacesBelow final : public OwnClass {
  public:
    /// Borrows the manager.
    explicit NameSpacesBelow(const ObjectManager& manager)
        : OwnClass("__Namespace", manager.nameSpaces()), manager_(manager) {}

    [[nodiscard]] std::string_view declaration() const noexcept override {
        return "class __Namespace { [Key] string Name; };";
    }

    [[nodiscard]] std::vector<Instance> instances(const std::string& nameSpace) const override {
        std::vector<Instance> below;
        const std::string start = nameSpace + '/';
        for (const std::string& each : manager_.nameSpaces()) {
            if (each.size() > start.size() && sameName(each.substr(0, start.size()), start)) {
                Instance made =
                    instanceOf(className(), {text("Name", each.substr(start.size()))}, {});
                made.path.nameSpace = nameSpace;
                below.push_back(std::move(made));
            }
        }
        return below;
    }

  private:
    const ObjectManager& manager_;
};

/// The instances of the interop namespace, made of what there is.
class InteropInstances {
  public:
    /// Borrows the manager.
    InteropInstances(const ObjectManager& manager, InteropSettings settings)
        : manager_(manager), settings_(std::move(settings)), identity_(manager) {}

    [[nodiscard]] std::vector<Instance> managers() const {
        return {instanceOf(
            managerClass, keysOf(managerClass, identity_.name),
            {text("ElementName", settings_.elementName),
             text("Description",
                  settings_.elementName + " object manager, version " + settings_.version),
             {"EnabledState", numberOf(enabled)},
             {"RequestedState", numberOf(notApplicable)},
             {"OperationalStatus", numbersOf({operational})},
             {"Started", flagOf(true)},
             {"GatherStatisticalData", flagOf(false)}})};
    }

    /// The interop namespace by both of its names: clients look for the one that they have
    /// asked by.
    [[nodiscard]] std::vector<Instance> nameSpaces() const {
        std::vector<Instance> made;
        for (const std::string& each : manager_.nameSpaces()) {
            made.push_back(nameSpaceOf(each));
        }
        made.push_back(nameSpaceOf("interop"));
        return made;
    }

    [[nodiscard]] std::vector<Instance> mechanisms() const {
        std::vector<Instance> made;
        for (const CommunicationMechanism& each : settings_.mechanisms) {
            made.push_back(
                instanceOf(mechanismClass, keysOf(mechanismClass, each.name),
                           {text("ElementName", each.name),
                            text("Description", each.description),
                            {"EnabledState", numberOf(enabled)},
                            {"RequestedState", numberOf(notApplicable)},
                            {"OperationalStatus", numbersOf({operational})},
                            {"CommunicationMechanism", numberOf(each.protocol)},
                            {"FunctionalProfilesSupported", numbersOf(each.operations)},
                            {"MultipleOperationsSupported", flagOf(false)},
                            {"AuthenticationMechanismsSupported", numbersOf(each.authentications)},
                            text("Version", each.version),
                            {"AdvertiseTypes", numbersOf({notAdvertised})}}));
        }
        return made;
    }

    /// The associations of the object manager with these.
    [[nodiscard]] std::vector<Instance> dependencies(const std::string& className,
                                                     const std::vector<Instance>& others) const {
        std::vector<Instance> made;
        made.reserve(others.size());
        const ObjectPath manager = managers().front().path;
        for (const Instance& other : others) {
            made.push_back(instanceOf(
                className,
                {{"Antecedent", referenceTo(manager)}, {"Dependent", referenceTo(other.path)}},
                {}));
        }
        return made;
    }

  private:
    // Values of the properties, as their value maps have them.
    static constexpr std::uint16_t enabled = 2;
    static constexpr std::uint16_t notApplicable = 12;
    static constexpr std::uint16_t operational = 2;
    static constexpr std::uint16_t notAdvertised = 2;
    static constexpr std::uint16_t otherSchema = 1;

    [[nodiscard]] std::vector<NamedValue> keysOf(const std::string& className,
                                                 const std::string& name) const {
        return {text("SystemCreationClassName", identity_.systemClass),
                text("SystemName", identity_.system), text("CreationClassName", className),
                text("Name", name)};
    }

    [[nodiscard]] Instance nameSpaceOf(const std::string& name) const {
        return instanceOf(
            nameSpaceClass,
            {text("SystemCreationClassName", identity_.systemClass),
             text("SystemName", identity_.system),
             text("ObjectManagerCreationClassName", managerClass),
             text("ObjectManagerName", identity_.name), text("CreationClassName", nameSpaceClass),
             text("Name", name)},
            {{"ClassInfo", numberOf(otherSchema)}, text("DescriptionOfClassInfo", "CIM 2.41")});
    }

    const ObjectManager& manager_;
    const InteropSettings settings_;
    const ManagerIdentity identity_;
};

}  // namespace

ManagerIdentity::ManagerIdentity(const ObjectManager& manager)
    : systemClass("CIM_ComputerSystem"), system(manager.host()), name("QVXZR:" + manager.host()) {}

void serveInterop(ObjectManager& manager, const InteropSettings& settings) {
    const auto made = std::make_shared<const InteropInstances>(manager, settings);
    const auto serve = [&manager](const char* className, ListedClass::List list) {
        manager.serve(std::make_unique<ListedClass>(className, std::move(list)));
    };
    serve(managerClass, [made] { return made->managers(); });
    serve(nameSpaceClass, [made] { return made->nameSpaces(); });
    serve(mechanismClass, [made] { return made->mechanisms(); });
    serve("CIM_NamespaceInManager",
          [made] { return made->dependencies("CIM_NamespaceInManager", made->nameSpaces()); });
    serve("CIM_CommMechanismForManager",
          [made] { return made->dependencies("CIM_CommMechanismForManager", made->mechanisms()); });
    manager.serve(std::make_unique<NameSpacesBelow>(manager));
}

}  // namespace cimom

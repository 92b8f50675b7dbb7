#pragma once

#include <map>
#include <string>
#include <vector>

namespace test {

/// The classes of MOF files as a client is told of them: read here once more, by
/// far simpler means than the product's, so that the one can be held against the other.
class ExpectedClasses {
  public:
    /// Reads all *.mof files of a directory. They hold no block comments.
    explicit ExpectedClasses(const std::string& directory);

    [[nodiscard]] const std::string& parentOf(const std::string& name) const {
        return classes_.at(name).parent;
    }
    /// The class and all below it, each followed by those below it.
    [[nodiscard]] std::vector<std::string> treeOf(const std::string& name) const;
    /// Names of all properties, inherited ones first.
    [[nodiscard]] std::vector<std::string> propertiesOf(const std::string& name) const;
    [[nodiscard]] bool isA(const std::string& name, const std::string& ancestor) const;

  private:
    struct Class {
        std::string parent;
        std::vector<std::string> properties;  ///< its own
    };
    std::map<std::string, Class> classes_;
    std::vector<std::string> order_;  ///< as declared
};

/// What wbemcli has to show of a machine all of whose interfaces use DHCP: worked
/// out from the names and addresses in its tree.
class ExpectedMachine {
  public:
    struct Interface {
        std::string name;
        std::string address;
        std::string server;
    };
    struct Object {
        std::string className;
        std::string path;        ///< "CLASS.KEY=VALUE,..."
        std::string properties;  ///< "NAME=VALUE,..." of those with a value
        std::string nameSpace = "root/cimv2";
    };

    /// `host`: the name of the machine. Without interfaces, there is no system either.
    ExpectedMachine(const ExpectedClasses& classes, const std::string& host,
                    const std::vector<Interface>& interfaces);

    /// The instances of a class and those below it.
    [[nodiscard]] std::vector<Object> instancesOf(const std::string& className) const;
    /// The object with all properties of its class, as one that is fetched singly.
    [[nodiscard]] Object fetched(Object object) const;
    /// The far ends of the object's associations of that class; empty: of all.
    [[nodiscard]] std::vector<Object> associators(const Object& of,
                                                  const std::string& associationClass) const;
    /// The associations themselves.
    [[nodiscard]] std::vector<Object> references(const Object& of,
                                                 const std::string& associationClass) const;

    static const std::vector<std::string>& elementClasses();
    /// In the order in which the provider walks them.
    static const std::vector<std::string>& associationClasses();

  private:
    struct Association {
        Object object;
        std::string one;  ///< paths of its ends
        std::string other;
    };

    void add(const std::string& className, const std::string& keys, const std::string& properties);
    void add(const std::string& className, const std::string& keys, const std::string& properties,
             const std::string& one, const std::string& other);
    void addInterface(const Interface& interface);
    [[nodiscard]] const Object& objectAt(const std::string& path) const;

    const ExpectedClasses& classes_;
    const std::string host_;
    std::map<std::string, std::vector<Object>> objects_;
    std::map<std::string, std::vector<Association>> associations_;
    std::map<std::string, Object> byPath_;
};

}  // namespace test

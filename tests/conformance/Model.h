#pragma once

#include <array>
#include <cstddef>
#include <string>
#include <vector>

#include "Request.h"
#include "cimom/ClassRepository.h"
#include "kit/Tree.h"

namespace conformance {

/// A network interface of the machine that the tests describe.
struct Interface {
    std::string name;
    bool ofServiceProcessor = false;
    bool dhcp = true;
    std::string address;             ///< empty: none
    Texts servers = {};              ///< DHCP servers
    std::string configuration = {};  ///< CONFIG_NAME of its file; empty: no file
};

/// Two associated objects, by the roles that they have.
struct Link {
    cimom::Instance association;
    std::array<std::string, 2> roles;
    std::array<std::size_t, 2> ends;  ///< positions among the objects
};

/// What clients are to see of a machine, worked out from its interfaces by rules that are
/// written down here once more: nothing of the providers is used.
class Model {
  public:
    Model(std::vector<Interface> interfaces, const std::string& hostName,
          const cimom::ClassRepository& repository);

    /// The machine as the providers read it, and where its interface files are.
    [[nodiscard]] std::vector<test::Json> tree() const;
    void writeFiles(const std::string& directory) const;

    /// Every object that is not an association.
    [[nodiscard]] const std::vector<cimom::Instance>& objects() const { return objects_; }
    [[nodiscard]] const std::vector<Link>& links() const { return links_; }
    /// Objects and associations.
    [[nodiscard]] std::vector<cimom::Instance> all() const;

    /// What is to come of a request for something that is there.
    [[nodiscard]] Response responseTo(const Request& request) const;

  private:
    std::size_t add(const std::string& className, const std::vector<std::string>& keys,
                    std::vector<cimom::NamedValue> properties);
    void link(const std::string& className, const std::string& firstRole, std::size_t first,
              const std::string& secondRole, std::size_t second,
              std::vector<cimom::NamedValue> properties = {});
    void addInterface(const Interface& interface, std::size_t host, std::size_t serviceProcessor);

    std::vector<Interface> interfaces_;
    std::string hostName_;
    const cimom::ClassRepository& repository_;
    std::vector<cimom::Instance> objects_;
    std::vector<Link> links_;
    std::size_t profile_ = 0;  // among the objects
};

}  // namespace conformance

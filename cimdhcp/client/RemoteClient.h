#pragma once

#include <memory>
#include <string>
#include <unordered_map>
#include <vector>

#include "client/Client.h"
#include "client/ServerUrl.h"
#include "transport/HttpConnection.h"

namespace cimom::wbem {
class OperationRequest;
struct OperationResponse;
}  // namespace cimom::wbem

namespace cimdhcp {

using cimom::wbem::Deadline;
using cimom::wbem::HttpSettings;

/// A server that could not be reached, with a remedy where there is one.
[[nodiscard]] Failure failureOf(const cimom::wbem::ConnectionError& error);

/// A WBEM server, reached with CIM-XML over HTTP (DSP0200, DSP0201). A server that cannot
/// be reached, or whose response cannot be understood, is a Failure with
/// ExitStatus::notLoaded, which does not name the server.
class RemoteClient : public Client {
  public:
    RemoteClient(const ServerUrl& url, HttpSettings settings, const Deadline& deadline,
                 std::string nameSpace);
    ~RemoteClient() override;
    RemoteClient(const RemoteClient&) = delete;
    RemoteClient& operator=(const RemoteClient&) = delete;

    /// Each class is asked for once, when it is first needed.
    [[nodiscard]] ClassLookup classes() override;
    /// The classes without subclasses, other than those of the standard's own schema: an
    /// implementation serves classes with names of its own. Their providers are not known.
    [[nodiscard]] std::vector<ClassEntry> servedClasses() override;
    /// Always true: only a response tells.
    [[nodiscard]] bool mayServe(std::string_view className) const override;
    /// What the interfaces' settings and IP endpoints tell.
    [[nodiscard]] std::optional<std::string> dataDir() const override;

    Response enumerateNames(const cimom::ObjectPath& path) override;
    Response enumerate(const cimom::ObjectPath& path) override;
    Response get(const cimom::ObjectPath& path) override;
    Response enumerateWith(const cimom::ObjectPath& path,
                           const std::vector<std::string>& properties) override;
    Response getWith(const cimom::ObjectPath& path,
                     const std::vector<std::string>& properties) override;
    Response modify(const cimom::Instance& instance,
                    const std::vector<std::string>& properties) override;
    /// The response has the path of what was created.
    Response createInstance(const cimom::Instance& instance);
    Response deleteInstance(const cimom::ObjectPath& path);
    Response associatorNames(const cimom::ObjectPath& path,
                             const cimom::AssociationRequest& request) override;
    Response associators(const cimom::ObjectPath& path,
                         const cimom::AssociationRequest& request) override;
    Response referenceNames(const cimom::ObjectPath& path,
                            const cimom::AssociationRequest& request) override;
    Response references(const cimom::ObjectPath& path,
                        const cimom::AssociationRequest& request) override;

    [[nodiscard]] Failure failure(const Response& response,
                                  const cimom::ObjectPath& asked) const override;

  private:
    cimom::wbem::OperationResponse ask(const cimom::wbem::OperationRequest& request);
    template <typename Read>
    Response responseTo(const cimom::wbem::OperationRequest& request, const Read& read);
    // Null: all properties.
    Response enumerateAsked(const cimom::ObjectPath& path,
                            const std::vector<std::string>* properties);
    Response getAsked(const cimom::ObjectPath& path, const std::vector<std::string>* properties);
    Response pathsOf(const cimom::wbem::OperationRequest& request);
    Response instancesOf(const cimom::wbem::OperationRequest& request);
    const cimom::ClassDeclaration* findClass(std::string_view className);

    cimom::wbem::HttpConnection connection_;
    /// By the name that was asked for; null: the server does not know the class.
    std::unordered_map<std::string, std::unique_ptr<const cimom::ClassDeclaration>> classes_;
};

}  // namespace cimdhcp

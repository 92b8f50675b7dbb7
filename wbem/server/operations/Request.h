#pragma once

#include <cstddef>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "cimom/ObjectManager.h"
#include "cimom/Requests.h"
#include "cimxml/Errors.h"
#include "operations/Caller.h"
#include "operations/EnumerationSessions.h"
#include "operations/ModificationLog.h"
#include "operations/Parameters.h"
#include "operations/ResponseBody.h"
#include "operations/Spool.h"

/// What the operations have in common.
namespace cimom::wbem {

/// One call while it is carried out.
struct Request {
    ObjectManager& manager;
    EnumerationSessions& sessions;
    std::size_t largestResult = 0;  ///< bytes
    const ModificationLog& log;
    const Call& call;
    const Caller& caller;
    Parameters parameters;
};

/// Carries one operation out. Throws CimError and NotValid.
using Operation = ResponseBody (*)(Request&);

struct NamedOperation {
    const char* name;
    Operation operation;
};

[[nodiscard]] std::vector<NamedOperation> instanceOperations();
[[nodiscard]] std::vector<NamedOperation> associationOperations();
[[nodiscard]] std::vector<NamedOperation> classOperations();
[[nodiscard]] std::vector<NamedOperation> pullOperations();
[[nodiscard]] std::vector<NamedOperation> changingOperations();
[[nodiscard]] std::vector<NamedOperation> queryOperations();
[[nodiscard]] std::vector<NamedOperation> qualifierOperations();

/// Throws CimError for a namespace that there is not.
void requireNameSpace(const Request& request);
/// The class. Throws CimError with `unknown` for an unknown one.
[[nodiscard]] const ClassDeclaration& requireClass(const Request& request,
                                                   const std::string& className, CimStatus unknown);

/// The path in the namespace of the call, also the references among its keys that
/// name none. A key without a name gets that of the class' only key.
[[nodiscard]] ObjectPath located(const Request& request, ObjectPath path);
[[nodiscard]] ObjectPath classPath(const Request& request, const std::string& className);

/// The CIM status code for a status of the object manager, which may be one of
/// CMPI alone.
[[nodiscard]] unsigned cimCode(const Status& status) noexcept;
/// Throws CimError for a status other than OK.
void requireOk(const Status& status);

/// Drops the properties that the class does not have; null: leaves all.
void cutToClass(Instance& instance, const ClassDeclaration* declaration);

/// INSTANCE, with class origins when asked for.
void writeInstanceOf(std::string& out, const Instance& instance,
                     const ClassRepository* originRepository);

/// A result as its XML, with the number of objects in it.
struct SpooledResult {
    std::shared_ptr<Spool> spool;
    std::size_t count = 0;
};

/// Writes the objects of a result into a spool as they come, so that memory holds
/// one of them. Absent ones are left out. Ends the request with CimError when its
/// client does not wait for it any more.
template <typename Object>
class SpoolingReceiver final : public ResultReceiver<Object> {
  public:
    using Write = std::function<void(std::string&, Object&)>;

    SpoolingReceiver(SpooledResult& result, const Caller& caller, Write write)
        : result_(result), caller_(caller), write_(std::move(write)) {}

    void beginCall() override;
    void take(std::optional<Object> object) override;
    void dropCall() override;

  private:
    SpooledResult& result_;
    const Caller& caller_;
    const Write write_;
    std::string text_;  ///< of one object; its memory is used again
    // What there was when the last call began.
    std::size_t sizeBefore_ = 0;
    std::size_t countBefore_ = 0;
};

extern template class SpoolingReceiver<ObjectPath>;
extern template class SpoolingReceiver<Instance>;

/// The result of a request that `ask` carries out with a receiver; each object as
/// `write(out, object)` writes it. Throws CimError when it ends with a status.
template <typename Object, typename Ask>
SpooledResult spooled(Request& request, typename SpoolingReceiver<Object>::Write write, Ask&& ask) {
    SpooledResult result{std::make_shared<Spool>(request.largestResult)};
    SpoolingReceiver<Object> receiver(result, request.caller, std::move(write));
    const RequestEnd end = std::forward<Ask>(ask)(receiver);
    requireOk(end.status);
    return result;
}

/// A response whose IRETURNVALUE is the text of a spool.
[[nodiscard]] ResponseBody spooledResponse(const Call& call, const SpooledResult& result);
/// A response with a list of classes in its IRETURNVALUE: `write(out, class)` for each.
template <typename Write>
ResponseBody classesResponse(const Call& call, std::vector<const ClassDeclaration*> classes,
                             Write write);
/// A response without a list: `content` is all that is in it.
[[nodiscard]] ResponseBody plainResponse(const Call& call, const std::string& content);

template <typename Write>
ResponseBody classesResponse(const Call& call, std::vector<const ClassDeclaration*> classes,
                             Write write) {
    return {responseHead(call) + "<IRETURNVALUE>",
            [classes = std::move(classes), write = std::move(write),
             next = std::size_t{0}](std::string& out) mutable {
                if (next == classes.size()) {
                    return false;
                }
                write(out, classes[next++]);
                return true;
            },
            "</IRETURNVALUE>" + responseTail(call)};
}

}  // namespace cimom::wbem

#pragma once

#include <string>
#include <vector>

#include "Parameters.h"
#include "wbem/Answer.h"
#include "wbem/Errors.h"
#include "wbem/Operations.h"

/// What the operations have in common.
namespace cimom::wbem {

/// One call while it is carried out.
struct Request {
    ObjectManager& manager;
    EnumerationSessions& sessions;
    const Operations::ModificationLog& log;
    const Call& call;
    const Caller& caller;
    Parameters parameters;
};

/// Carries one operation out. Throws CimError and NotValid.
using Operation = Answer (*)(Request&);

struct NamedOperation {
    const char* name;
    Operation operation;
};

[[nodiscard]] std::vector<NamedOperation> instanceOperations();
[[nodiscard]] std::vector<NamedOperation> associationOperations();
[[nodiscard]] std::vector<NamedOperation> classOperations();
[[nodiscard]] std::vector<NamedOperation> pullOperations();
[[nodiscard]] Answer modifyInstance(Request& request);

/// The class of the call's namespace. Throws CimError for a namespace that there
/// is not, or with `unknown` for an unknown class.
void requireNameSpace(const Request& request);
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

/// What providers delivered, without the entries that they delivered as null.
[[nodiscard]] std::vector<ObjectPath> present(std::vector<std::optional<ObjectPath>> paths);
[[nodiscard]] std::vector<Instance> present(std::vector<std::optional<Instance>> instances);

/// Drops the properties that the class does not have.
void cutToClass(std::vector<Instance>& instances, const ClassDeclaration& declaration);

/// INSTANCE, with class origins when asked for.
void writeInstanceOf(std::string& out, const Instance& instance,
                     const ClassRepository* originRepository);

/// An answer with a list in its IRETURNVALUE: `write(out, object)` for each object
/// in their order, each of which is forgotten when it has been written. `behind`
/// are the elements after it.
template <typename Object, typename Write>
Answer listAnswer(const Call& call, std::vector<Object> objects, Write write,
                  const std::string& behind = "");
/// An answer without a list: `content` is all that is in it.
[[nodiscard]] Answer plainAnswer(const Call& call, const std::string& content);

template <typename Object, typename Write>
Answer listAnswer(const Call& call, std::vector<Object> objects, Write write,
                  const std::string& behind) {
    return {answerHead(call) + "<IRETURNVALUE>",
            [objects = std::move(objects), write = std::move(write),
             next = std::size_t{0}](std::string& out) mutable {
                if (next == objects.size()) {
                    return false;
                }
                Object object = std::move(objects[next++]);
                write(out, object);
                return true;
            },
            "</IRETURNVALUE>" + behind + answerTail(call)};
}

}  // namespace cimom::wbem

// Queries (DSP0200, 5.4.2); those that are pulled are among the pull operations.
#include "cimom/ClassDeclaration.h"
#include "cimom/Instance.h"
#include "cimxml/ObjectWriter.h"
#include "operations/RequestedQuery.h"

namespace cimom::wbem {

RequestedQuery requiredQuery(Request& request, const char* languageParameter,
                             const char* textParameter) {
    const std::string language = request.parameters.requiredText(languageParameter);
    const std::string text = request.parameters.requiredText(textParameter);
    try {
        Query query = Query::parse(language, text);
        const ClassDeclaration& declaration =
            requireClass(request, query.className(), CimStatus::invalidClass);
        return {std::move(query), declaration};
    } catch (const QueryError& error) {
        throw CimError(static_cast<unsigned>(error.code), error.what());
    }
}

namespace {

ResponseBody execQuery(Request& request) {
    const RequestedQuery query = requiredQuery(request, "QueryLanguage", "Query");
    request.parameters.finish();
    return spooledResponse(
        request.call,
        spooled<Instance>(
            request,
            [&host = request.manager.host()](std::string& out, const Instance& instance) {
                out += "<VALUE.OBJECTWITHPATH>";
                writeInstancePath(out, instance.path, host);
                writeInstance(out, instance, nullptr);
                out += "</VALUE.OBJECTWITHPATH>";
            },
            [&](auto& receiver) {
                return request.manager.execQuery(request.call.nameSpace, query.query,
                                                 {std::nullopt, request.caller.user.value_or("")},
                                                 receiver);
            }));
}

}  // namespace

std::vector<NamedOperation> queryOperations() {
    return {{"ExecQuery", execQuery}};
}

}  // namespace cimom::wbem

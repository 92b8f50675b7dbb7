#include "broker/objects/BrokerRecords.h"

#include "broker/Conversion.h"
#include "broker/objects/BrokerStatus.h"
#include "cimom/ClassRepository.h"
#include "cimom/Instance.h"
#include "cimom/Query.h"

namespace cimom::broker {

namespace {

CMPIStatus release(CMPISelectExp* self) {
    SelectExpRecord* const expression = selectExpOf(self);
    if (expression == nullptr) {
        return statusOf(CMPI_RC_ERR_INVALID_HANDLE);
    }
    if (expression->arena->isRoot(expression)) {
        const std::unique_ptr<Arena> ended(expression->arena);
    }
    return statusOf(CMPI_RC_OK);
}

CMPISelectExp* clone(const CMPISelectExp* self, CMPIStatus* rc) {
    return guarded<CMPISelectExp*>(rc, nullptr, [self](CMPIrc& code) -> CMPISelectExp* {
        const SelectExpRecord* const expression = selectExpOf(self);
        if (expression == nullptr) {
            code = CMPI_RC_ERR_INVALID_HANDLE;
            return nullptr;
        }
        auto arena = Arena::forClone();
        SelectExpRecord* const copy = makeSelectExp(
            *arena, *expression->classes, expression->query->view(), expression->language->view());
        arena.release()->setRoot(copy);
        return copy;
    });
}

CMPIBoolean evaluate(const CMPISelectExp* self, const CMPIInstance* inst, CMPIStatus* rc) {
    return guarded<CMPIBoolean>(rc, 0, [=](CMPIrc& code) -> CMPIBoolean {
        const SelectExpRecord* const expression = selectExpOf(self);
        const InstanceRecord* const instance = instanceOf(inst);
        if (expression == nullptr || instance == nullptr) {
            code =
                expression == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_ERR_INVALID_PARAMETER;
            return 0;
        }
        try {
            const Query query =
                Query::parse(expression->language->view(), expression->query->view());
            const bool matches = query.matches(toModel(*instance), [&](auto one, auto other) {
                return expression->classes->isA(one, other);
            });
            return matches ? 1 : 0;
        } catch (const QueryError& error) {
            code = error.code;
            return 0;
        }
    });
}

CMPIString* getString(const CMPISelectExp* self, CMPIStatus* rc) {
    const SelectExpRecord* const expression = selectExpOf(self);
    setStatus(rc, expression == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_OK);
    return expression == nullptr ? nullptr : expression->query;
}

/// The normal forms of the condition are not made: no provider is known that needs them.
CMPISelectCond* condition(const CMPISelectExp* self, CMPIStatus* rc) {
    setStatus(
        rc, selectExpOf(self) == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

CMPIBoolean evaluateUsingAccessor(const CMPISelectExp* self, CMPIAccessor*, void*, CMPIStatus* rc) {
    setStatus(
        rc, selectExpOf(self) == nullptr ? CMPI_RC_ERR_INVALID_HANDLE : CMPI_RC_ERR_NOT_SUPPORTED);
    return 0;
}

}  // namespace

const CMPISelectExpFT selectExpTable{CMPIVersion200, release,   clone,     evaluate,
                                     getString,      condition, condition, evaluateUsingAccessor};

SelectExpRecord* selectExpOf(const CMPISelectExp* expression) noexcept {
    return expression != nullptr && expression->ft == &selectExpTable
               ? static_cast<SelectExpRecord*>(expression->hdl)
               : nullptr;
}

SelectExpRecord* makeSelectExp(Arena& arena, const ClassRepository& classes, std::string_view query,
                               std::string_view language) {
    auto* const expression = arena.make<SelectExpRecord>();
    *expression = SelectExpRecord{{expression, &selectExpTable},
                                  &arena,
                                  &classes,
                                  makeString(arena, query),
                                  makeString(arena, language)};
    return expression;
}

}  // namespace cimom::broker

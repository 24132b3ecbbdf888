// The select expression handed to an indication MI: it carries the query
// and its language. Evaluation is the object manager's business here, so
// the condition and evaluation functions are not offered.
#include "BrokerState.h"
#include "Objects.h"

namespace host::detail
{

void SelectExpObject::copyFrom(const SelectExpObject& other)
{
    query = other.query;
    language = other.language;
}

namespace
{

using Exp = SelectExpObject;

CMPIBoolean expEvaluate(const CMPISelectExp* se, const CMPIInstance*,
                        CMPIStatus* rc)
{
    setStatus(rc, Exp::of(se) ? CMPI_RC_ERR_NOT_SUPPORTED
                              : CMPI_RC_ERR_INVALID_HANDLE);
    return 0;
}

CMPIString* expGetString(const CMPISelectExp* se, CMPIStatus* rc)
{
    const Exp* e = Exp::of(se);
    if (e == nullptr)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    auto* s = e->broker->make<StringObject>();
    s->text = e->query;
    setStatus(rc, CMPI_RC_OK);
    return &s->cmpi;
}

CMPISelectCond* expGetCondition(const CMPISelectExp* se, CMPIStatus* rc)
{
    setStatus(rc, Exp::of(se) ? CMPI_RC_ERR_NOT_SUPPORTED
                              : CMPI_RC_ERR_INVALID_HANDLE);
    return nullptr;
}

CMPIBoolean expEvaluateUsingAccessor(const CMPISelectExp* se, CMPIAccessor*,
                                     void*, CMPIStatus* rc)
{
    setStatus(rc, Exp::of(se) ? CMPI_RC_ERR_NOT_SUPPORTED
                              : CMPI_RC_ERR_INVALID_HANDLE);
    return 0;
}

} // namespace

CMPISelectExpFT selectExpFT = {
    200,
    releaseObject<Exp, CMPISelectExp>,
    cloneObject<Exp, CMPISelectExp>,
    expEvaluate,
    expGetString,
    expGetCondition,
    expGetCondition,
    expEvaluateUsingAccessor,
};

} // namespace host::detail

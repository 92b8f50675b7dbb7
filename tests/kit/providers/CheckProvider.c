/* A provider in plain C that tries every function of its broker, and tells by
 * instances of Test_Check what it found. */
#include <cmpift.h>
#include <errno.h>
#include <stdlib.h>
#include <string.h>

static const CMPIBroker* broker;

typedef struct {
    const CMPIContext* context;
    const CMPIResult* result;
    const CMPIObjectPath* path;
} Call;

static int isOk(CMPIStatus status) {
    return status.rc == CMPI_RC_OK && status.msg == NULL;
}

/* The idiom of C providers: the address of a plain variable, or a text itself,
 * is passed where a value is asked for. */
static const CMPIValue* at(const void* variable) {
    return variable;
}

static CMPIStatus unset(void) {
    CMPIStatus status;
    status.rc = CMPI_RC_ERROR;
    status.msg = (CMPIString*)&status;
    return status;
}

static int isText(const CMPIString* string, const char* text) {
    return string != NULL && strcmp(string->ft->getCharPtr(string, NULL), text) == 0 &&
           strcmp((const char*)string->hdl, text) == 0;
}

static void report(const Call* call, const char* name, int passed) {
    CMPIObjectPath* op = broker->eft->newObjectPath(broker, "root/test", "Test_Check", NULL);
    CMPIBoolean value = passed ? 1 : 0;
    op->ft->addKey(op, "Id", at(name), CMPI_chars);
    CMPIInstance* instance = broker->eft->newInstance(broker, op, NULL);
    instance->ft->setProperty(instance, "Id", at(name), CMPI_chars);
    instance->ft->setProperty(instance, "Passed", at(&value), CMPI_boolean);
    call->result->ft->returnInstance(call->result, instance);
}

static void checkStrings(const Call* call) {
    CMPIStatus rc = unset();
    CMPIString* string = broker->eft->newString(broker, "text", &rc);
    report(call, "newString", isOk(rc) && isText(string, "text"));
    rc = unset();
    CMPIString* clone = string->ft->clone(string, &rc);
    report(call, "cloneString", isOk(rc) && clone != string && isText(clone, "text"));
    report(call, "releaseString",
           isOk(clone->ft->release(clone)) && isOk(string->ft->release(string)) &&
               isText(string, "text"));
    rc = unset();
    report(call, "newStringNull",
           broker->eft->newString(broker, NULL, &rc) == NULL &&
               rc.rc == CMPI_RC_ERR_INVALID_PARAMETER && rc.msg == NULL);
    report(call, "stringVersion", string->ft->ftVersion == CMPIVersion200);
}

static void checkArrays(const Call* call) {
    CMPIStatus rc = unset();
    CMPIUint16 number = 7;
    CMPIString* string = broker->eft->newString(broker, "one", NULL);
    CMPIArray* texts = broker->eft->newArray(broker, 3, CMPI_string, &rc);
    report(call, "newArray",
           isOk(rc) && texts->ft->getSize(texts, NULL) == 3 &&
               texts->ft->getSimpleType(texts, NULL) == CMPI_string);
    report(call, "newArrayBadType",
           broker->eft->newArray(broker, 1, CMPI_stringA, &rc) == NULL &&
               rc.rc == CMPI_RC_ERR_INVALID_DATA_TYPE);
    report(call, "setElementAt",
           isOk(texts->ft->setElementAt(texts, 0, at(&string), CMPI_string)) &&
               isOk(texts->ft->setElementAt(texts, 1, at("two"), CMPI_chars)) &&
               texts->ft->setElementAt(texts, 2, at(&number), CMPI_uint16).rc ==
                   CMPI_RC_ERR_TYPE_MISMATCH &&
               texts->ft->setElementAt(texts, 3, NULL, CMPI_string).rc ==
                   CMPI_RC_ERR_NO_SUCH_PROPERTY);
    CMPIData first = texts->ft->getElementAt(texts, 0, &rc);
    CMPIData second = texts->ft->getElementAt(texts, 1, NULL);
    CMPIData third = texts->ft->getElementAt(texts, 2, NULL);
    report(call, "getElementAt",
           isOk(rc) && first.type == CMPI_string && isText(first.value.string, "one") &&
               second.type == CMPI_string && isText(second.value.string, "two") &&
               third.state == CMPI_nullValue);
    texts->ft->getElementAt(texts, 9, &rc);
    report(call, "getElementOutOfRange", rc.rc == CMPI_RC_ERR_NO_SUCH_PROPERTY);
    CMPIArray* clone = texts->ft->clone(texts, &rc);
    texts->ft->setElementAt(texts, 0, NULL, CMPI_string);
    report(call, "cloneArray",
           isOk(rc) && isText(clone->ft->getElementAt(clone, 0, NULL).value.string, "one"));
    report(call, "releaseArray",
           isOk(clone->ft->release(clone)) && isOk(texts->ft->release(texts)));
}

static void checkDateTimes(const Call* call) {
    CMPIStatus rc = unset();
    CMPIDateTime* now = broker->eft->newDateTime(broker, &rc);
    report(call, "newDateTime",
           isOk(rc) && !now->ft->isInterval(now, NULL) &&
               now->ft->getBinaryFormat(now, NULL) > 1600000000000000ULL);
    CMPIDateTime* text =
        broker->eft->newDateTimeFromChars(broker, "20240131093000.000000+060", &rc);
    report(call, "newDateTimeFromChars",
           isOk(rc) && text->ft->getBinaryFormat(text, NULL) == 1706689800000000ULL &&
               isText(text->ft->getStringFormat(text, NULL), "20240131093000.000000+060"));
    CMPIDateTime* day = broker->eft->newDateTimeFromBinary(broker, 86400000000ULL, 1, &rc);
    report(call, "newDateTimeFromBinary",
           isOk(rc) && day->ft->isInterval(day, NULL) == 1 &&
               isText(day->ft->getStringFormat(day, NULL), "00000001000000.000000:000"));
    report(call, "newDateTimeBad",
           broker->eft->newDateTimeFromChars(broker, "yesterday", &rc) == NULL &&
               rc.rc == CMPI_RC_ERR_INVALID_PARAMETER);
    CMPIDateTime* clone = day->ft->clone(day, &rc);
    report(call, "cloneDateTime",
           isOk(rc) && clone->ft->getBinaryFormat(clone, NULL) == 86400000000ULL);
    report(call, "releaseDateTime", isOk(clone->ft->release(clone)) && isOk(day->ft->release(day)));
}

static void checkPaths(const Call* call) {
    CMPIStatus rc = unset();
    CMPIUint64 big = 18446744073709551615ULL;
    CMPIString* name = NULL;
    CMPIObjectPath* nothing = NULL;
    CMPIObjectPath* op = broker->eft->newObjectPath(broker, "root/test", "Test_Left", &rc);
    CMPIObjectPath* other = broker->eft->newObjectPath(broker, NULL, NULL, NULL);
    report(call, "newObjectPath",
           isOk(rc) && op->ft->getKeyCount(op, NULL) == 0 &&
               isText(op->ft->getHostname(op, NULL), "") &&
               isText(other->ft->getNameSpace(other, NULL), ""));
    report(call, "addKey",
           isOk(op->ft->addKey(op, "Id", at("1"), CMPI_chars)) &&
               isOk(op->ft->addKey(op, "Number", at(&big), CMPI_uint64)) &&
               isOk(op->ft->addKey(op, "ID", at("2"), CMPI_chars)) &&
               op->ft->getKeyCount(op, NULL) == 2);
    report(call, "addNullKey",
           op->ft->addKey(op, "Null", NULL, CMPI_string).rc == CMPI_RC_ERR_INVALID_PARAMETER &&
               op->ft->addKey(op, "Null", at(&nothing), CMPI_ref).rc ==
                   CMPI_RC_ERR_INVALID_PARAMETER &&
               op->ft->getKeyCount(op, NULL) == 2);
    CMPIData id = op->ft->getKey(op, "id", &rc);
    report(call, "getKey",
           isOk(rc) && id.type == CMPI_string && id.state == CMPI_keyValue &&
               isText(id.value.string, "2"));
    op->ft->getKey(op, "Missing", &rc);
    report(call, "getMissingKey", rc.rc == CMPI_RC_ERR_NO_SUCH_PROPERTY && rc.msg == NULL);
    CMPIData number = op->ft->getKeyAt(op, 1, &name, &rc);
    report(call, "getKeyAt",
           isOk(rc) && isText(name, "Number") && number.type == CMPI_uint64 &&
               number.value.uint64 == big);
    op->ft->getKeyAt(op, 2, &name, &rc);
    report(call, "getKeyAtEnd", rc.rc == CMPI_RC_ERR_NO_SUCH_PROPERTY && name == NULL);
    op->ft->setHostname(op, "host");
    report(call, "setFromPath",
           isOk(other->ft->setNameSpaceFromObjectPath(other, op)) &&
               isText(other->ft->getNameSpace(other, NULL), "root/test") &&
               isText(other->ft->getClassName(other, NULL), "Test_Left") &&
               isText(other->ft->getHostname(other, NULL), "") &&
               isOk(other->ft->setHostAndNameSpaceFromObjectPath(other, op)) &&
               isText(other->ft->getHostname(other, NULL), "host"));
    report(call, "setComponents",
           isOk(other->ft->setNameSpace(other, "a/b")) &&
               isOk(other->ft->setClassName(other, "Class")) &&
               isOk(other->ft->setHostname(other, NULL)) &&
               isText(other->ft->getNameSpace(other, NULL), "a/b") &&
               isText(other->ft->getClassName(other, NULL), "Class") &&
               isText(other->ft->getHostname(other, NULL), ""));
    report(call, "pathToString",
           isText(op->ft->toString(op, &rc),
                  "root/test:Test_Left.Id=\"2\",Number=18446744073709551615"));
    CMPIObjectPath* clone = op->ft->clone(op, &rc);
    op->ft->addKey(op, "Id", at("3"), CMPI_chars);
    report(call, "clonePath",
           isOk(rc) && isText(clone->ft->getKey(clone, "Id", NULL).value.string, "2"));
    report(call, "releasePath", isOk(clone->ft->release(clone)) && isOk(op->ft->release(op)));
    CMPIObjectPath* types = broker->eft->newObjectPath(broker, "root/test", "Test_Types", NULL);
    CMPIData abstract = types->ft->getClassQualifier(types, "Description", &rc);
    report(call, "getClassQualifier",
           isOk(rc) && abstract.type == CMPI_string &&
               isText(abstract.value.string, "The parent of all"));
    CMPIData text = types->ft->getPropertyQualifier(types, "string", "description", &rc);
    report(call, "getPropertyQualifier", isOk(rc) && isText(text.value.string, "A text"));
    types->ft->getPropertyQualifier(types, "Nope", "Key", &rc);
    report(call, "getQualifierOfMissing", rc.rc == CMPI_RC_ERR_NO_SUCH_PROPERTY);
    types->ft->getMethodQualifier(types, "m", "q", &rc);
    int method = rc.rc == CMPI_RC_ERR_NOT_SUPPORTED;
    types->ft->getParameterQualifier(types, "m", "p", "q", &rc);
    report(call, "getMethodQualifier", method && rc.rc == CMPI_RC_ERR_NOT_SUPPORTED);
}

static void checkInstances(const Call* call) {
    CMPIStatus rc = unset();
    CMPIUint16 number = 16;
    CMPIString* name = NULL;
    CMPIObjectPath* op = broker->eft->newObjectPath(broker, "root/test", "Test_Types", NULL);
    op->ft->addKey(op, "Id", at("1"), CMPI_chars);
    CMPIInstance* instance = broker->eft->newInstance(broker, op, &rc);
    report(call, "newInstance", isOk(rc) && instance->ft->getPropertyCount(instance, NULL) == 0);
    report(call, "newInstanceNull",
           broker->eft->newInstance(broker, NULL, &rc) == NULL &&
               rc.rc == CMPI_RC_ERR_INVALID_PARAMETER);
    report(call, "setProperty",
           isOk(instance->ft->setProperty(instance, "String", at("s"), CMPI_chars)) &&
               isOk(instance->ft->setProperty(instance, "uint16", at(&number), CMPI_uint16)) &&
               isOk(instance->ft->setProperty(instance, "Note", NULL, CMPI_string)) &&
               isOk(instance->ft->setProperty(instance, "Unknown", at(&number), CMPI_uint16)));
    report(call, "setPropertyMismatch",
           instance->ft->setProperty(instance, "Uint16A", at(&number), CMPI_uint16).rc ==
                   CMPI_RC_ERR_TYPE_MISMATCH &&
               instance->ft->setProperty(instance, "Uint16", at("x"), CMPI_chars).rc ==
                   CMPI_RC_ERR_TYPE_MISMATCH &&
               instance->ft->setProperty(instance, "String", at(&number), CMPI_uint16).rc ==
                   CMPI_RC_ERR_TYPE_MISMATCH);
    CMPIData got = instance->ft->getProperty(instance, "STRING", &rc);
    report(call, "getProperty",
           isOk(rc) && got.type == CMPI_string && got.state == CMPI_goodValue &&
               isText(got.value.string, "s"));
    got = instance->ft->getProperty(instance, "Note", &rc);
    report(call, "getNullProperty",
           isOk(rc) && got.type == CMPI_string && got.state == CMPI_nullValue);
    got = instance->ft->getProperty(instance, "Boolean", &rc);
    report(call, "getMissingProperty",
           rc.rc == CMPI_RC_ERR_NO_SUCH_PROPERTY && (got.state & CMPI_notFound) != 0);
    got = instance->ft->getPropertyAt(instance, 1, &name, &rc);
    report(call, "getPropertyAt", isOk(rc) && isText(name, "uint16") && got.value.uint16 == 16);
    report(call, "getPropertyCount", instance->ft->getPropertyCount(instance, NULL) == 4);
    CMPIObjectPath* path = instance->ft->getObjectPath(instance, &rc);
    path->ft->addKey(path, "Id", at("changed"), CMPI_chars);
    CMPIObjectPath* again = instance->ft->getObjectPath(instance, &rc);
    report(call, "getObjectPath",
           isOk(rc) && isText(again->ft->getKey(again, "Id", NULL).value.string, "1"));
    report(call, "setPropertyWithOrigin",
           isOk(instance->ft->setPropertyWithOrigin(instance, "Note", at("n"), CMPI_chars,
                                                    "Test_Base")));
    CMPIInstance* clone = instance->ft->clone(instance, &rc);
    report(call, "cloneInstance",
           isOk(rc) && isText(clone->ft->getProperty(clone, "Note", NULL).value.string, "n"));
    report(call, "releaseInstance",
           isOk(clone->ft->release(clone)) && isOk(instance->ft->release(instance)));
    const char* kept[] = {"NOTE", "Sint8", NULL};
    CMPISint8 small = -8;
    report(call, "setPropertyFilter",
           isOk(instance->ft->setPropertyFilter(instance, kept, NULL)) &&
               instance->ft->getPropertyCount(instance, NULL) == 1 &&
               isOk(instance->ft->setProperty(instance, "String", at("s"), CMPI_chars)) &&
               isOk(instance->ft->setProperty(instance, "Sint8", at(&small), CMPI_sint8)) &&
               instance->ft->getPropertyCount(instance, NULL) == 2);
    op->ft->setClassName(op, "Test_Inner");
    report(call, "setObjectPath",
           isOk(instance->ft->setObjectPath(instance, op)) &&
               isText(instance->ft->getObjectPath(instance, NULL)
                          ->ft->getClassName(instance->ft->getObjectPath(instance, NULL), NULL),
                      "Test_Inner") &&
               instance->ft->setObjectPath(instance, NULL).rc == CMPI_RC_ERR_INVALID_PARAMETER);
    op->ft->setClassName(op, "Nobody_Knows");
    CMPIInstance* unknown = broker->eft->newInstance(broker, op, &rc);
    report(call, "newInstanceOfUnknownClass",
           isOk(rc) && isOk(unknown->ft->setProperty(unknown, "Any", at(&small), CMPI_sint8)));
}

static void checkArgsAndContext(const Call* call) {
    CMPIStatus rc = unset();
    CMPIString* name = NULL;
    CMPIUint32 number = 32;
    CMPIArgs* args = broker->eft->newArgs(broker, &rc);
    report(call, "newArgs", isOk(rc) && args->ft->getArgCount(args, NULL) == 0);
    report(
        call, "addArg",
        isOk(args->ft->addArg(args, "a", at(&number), CMPI_uint32)) &&
            args->ft->addArg(args, "b", at(&number), CMPI_ptr).rc == CMPI_RC_ERR_INVALID_DATA_TYPE);
    report(call, "getArg",
           args->ft->getArg(args, "A", &rc).value.uint32 == 32 && isOk(rc) &&
               args->ft->getArgAt(args, 0, &name, &rc).value.uint32 == 32 && isText(name, "a"));
    args->ft->getArg(args, "b", &rc);
    report(call, "getMissingArg", rc.rc == CMPI_RC_ERR_NO_SUCH_PROPERTY);
    CMPIArgs* clone = args->ft->clone(args, &rc);
    report(call, "cloneArgs",
           isOk(rc) && clone->ft->getArgCount(clone, NULL) == 1 &&
               isOk(clone->ft->release(clone)) && isOk(args->ft->release(args)));

    const CMPIContext* context = call->context;
    CMPIData flags = context->ft->getEntry(context, CMPIInvocationFlags, &rc);
    report(
        call, "contextFlags",
        isOk(rc) && flags.type == CMPI_uint32 && flags.value.uint32 == CMPI_FLAG_DeepInheritance);
    CMPIData principal = context->ft->getEntry(context, CMPIPrincipal, &rc);
    report(call, "contextPrincipal",
           isOk(rc) && principal.type == CMPI_string && isText(principal.value.string, "someone"));
    CMPICount count = context->ft->getEntryCount(context, NULL);
    report(call, "addEntry",
           isOk(context->ft->addEntry(context, "Mine", at(&number), CMPI_uint32)) &&
               context->ft->getEntryCount(context, NULL) == count + 1 &&
               context->ft->getEntryAt(context, count, &name, &rc).value.uint32 == 32 &&
               isText(name, "Mine"));
    context->ft->getEntry(context, "None", &rc);
    report(call, "getMissingEntry", rc.rc == CMPI_RC_ERR_NO_SUCH_PROPERTY);
    CMPIContext* copy = context->ft->clone(context, &rc);
    report(call, "cloneContext",
           isOk(rc) && copy->ft->getEntryCount(copy, NULL) == count + 1 &&
               isOk(copy->ft->release(copy)));
}

static void checkServices(const Call* call) {
    CMPIStatus rc = unset();
    CMPIArray* projection = (CMPIArray*)&rc;
    CMPIObjectPath* op = broker->eft->newObjectPath(broker, "root/test", "test_left", NULL);
    report(call, "classPathIsA",
           broker->eft->classPathIsA(broker, op, "TEST_BASE", &rc) == 1 && isOk(rc) &&
               broker->eft->classPathIsA(broker, op, "Test_Left", NULL) == 1 &&
               broker->eft->classPathIsA(broker, op, "Test_Right", NULL) == 0 &&
               broker->eft->classPathIsA(broker, op, NULL, &rc) == 0 &&
               rc.rc == CMPI_RC_ERR_INVALID_PARAMETER);
    CMPIObjectPath* nowhere = broker->eft->newObjectPath(broker, "", "Test_Left", NULL);
    report(call, "classPathIsAWithoutNameSpace",
           broker->eft->classPathIsA(broker, nowhere, "Test_Base", &rc) == 0 &&
               rc.rc == CMPI_RC_ERR_INVALID_NAMESPACE);
    CMPIObjectPath* unknown = broker->eft->newObjectPath(broker, "root/test", "Nobody", NULL);
    report(call, "classPathIsAUnknown",
           broker->eft->classPathIsA(broker, unknown, "nobody", NULL) == 1 &&
               broker->eft->classPathIsA(broker, unknown, "Test_Base", NULL) == 0);
    report(call, "toString",
           isText(broker->eft->toString(broker, op, &rc), "root/test:test_left") && isOk(rc) &&
               broker->eft->toString(broker, NULL, &rc) == NULL &&
               rc.rc == CMPI_RC_ERR_INVALID_PARAMETER);
    report(call, "isOfType",
           broker->eft->isOfType(broker, op, "CMPIObjectPath", &rc) == 1 && isOk(rc) &&
               broker->eft->isOfType(broker, op, "CMPIInstance", NULL) == 0);
    report(call, "getType",
           isText(broker->eft->getType(broker, call->result, &rc), "CMPIResult") && isOk(rc));
    CMPIString* message =
        broker->eft->getMessage(broker, "id", "$0 of $1 in $2: $3 $4", &rc, 4, CMPI_sint32, -3L,
                                CMPI_uint64, 4ULL, CMPI_chars, "five", CMPI_boolean, 1);
    report(call, "getMessage", isOk(rc) && isText(message, "-3 of 4 in five: true $4"));
    message = broker->eft->getMessage2(broker, "id", NULL, "$0", &rc, 1, CMPI_uint32, 4000000000UL);
    report(call, "getMessage2", isOk(rc) && isText(message, "4000000000"));
    CMPIMsgFileHandle file = &rc;
    report(call, "openMessageFile",
           broker->eft->openMessageFile(broker, "file", &file).rc == CMPI_RC_ERR_NOT_FOUND &&
               file == NULL && isOk(broker->eft->closeMessageFile(broker, file)));
    report(call, "logMessage",
           broker->eft->logMessage(broker, CMPI_SEV_INFO, "id", "text", NULL).rc ==
                   CMPI_RC_ERR_NOT_SUPPORTED &&
               broker->eft->trace(broker, CMPI_LEV_INFO, "c", "text", NULL).rc ==
                   CMPI_RC_ERR_NOT_SUPPORTED);
    report(
        call, "newSelectExp",
        broker->eft->newSelectExp(broker, "SELECT * FROM x", "Latin", &projection, &rc) == NULL &&
            rc.rc == CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED && projection == NULL &&
            broker->eft->newSelectExp(broker, "SELECT", "WQL", NULL, &rc) == NULL &&
            rc.rc == CMPI_RC_ERR_INVALID_QUERY);
    CMPISelectExp* all =
        broker->eft->newSelectExp(broker, "SELECT * FROM Test_Types", "WQL", &projection, &rc);
    report(call, "selectAll",
           isOk(rc) && projection == NULL &&
               isText(all->ft->getString(all, NULL), "SELECT * FROM Test_Types"));
    CMPISelectExp* some = broker->eft->newSelectExp(
        broker, "SELECT Id, Note FROM Test_Types WHERE Id = 'one'", "DMTF:CQL", &projection, &rc);
    report(call, "selectSome",
           isOk(rc) && projection != NULL && projection->ft->getSize(projection, NULL) == 2 &&
               isText(projection->ft->getElementAt(projection, 1, NULL).value.string, "Note"));
    CMPIObjectPath* types = broker->eft->newObjectPath(broker, "root/test", "Test_Types", NULL);
    CMPIInstance* one = broker->eft->newInstance(broker, types, NULL);
    one->ft->setProperty(one, "Id", at("one"), CMPI_chars);
    CMPISelectExp* copy = some->ft->clone(some, &rc);
    report(call, "evaluate",
           isOk(rc) && copy->ft->evaluate(copy, one, &rc) && isOk(rc) &&
               all->ft->evaluate(all, one, NULL) && !some->ft->evaluate(some, NULL, &rc) &&
               rc.rc == CMPI_RC_ERR_INVALID_PARAMETER && isOk(copy->ft->release(copy)));
    one->ft->setProperty(one, "Id", at("two"), CMPI_chars);
    report(call, "evaluateOther", !some->ft->evaluate(some, one, &rc) && isOk(rc));
    report(call, "normalForms",
           some->ft->getDOC(some, &rc) == NULL && rc.rc == CMPI_RC_ERR_NOT_SUPPORTED &&
               some->ft->getCOD(some, &rc) == NULL && rc.rc == CMPI_RC_ERR_NOT_SUPPORTED &&
               !some->ft->evaluateUsingAccessor(some, NULL, NULL, &rc) &&
               rc.rc == CMPI_RC_ERR_NOT_SUPPORTED);
    report(
        call, "capabilities",
        (broker->bft->brokerCapabilities & CMPI_MB_InstanceManipulation) ==
                CMPI_MB_InstanceManipulation &&
            (broker->bft->brokerCapabilities & CMPI_MB_QueryExecution) == CMPI_MB_QueryExecution &&
            (broker->bft->brokerCapabilities & CMPI_MB_Indications) == CMPI_MB_Indications &&
            broker->bft->brokerVersion == CMPIVersion200 && broker->bft->brokerName != NULL);
}

static void checkErrors(const Call* call) {
    CMPIStatus rc = unset();
    CMPIError* error = broker->eft->newCMPIError(broker, "owner", "id", "message", ErrorSevHigh,
                                                 Timeout, CMPI_RC_ERR_FAILED, &rc);
    report(call, "newCMPIError",
           isOk(rc) && isText(error->ft->getOwningEntity(error, NULL), "owner") &&
               isText(error->ft->getMessageID(error, NULL), "id") &&
               isText(error->ft->getMessage(error, NULL), "message") &&
               error->ft->getPerceivedSeverity(error, NULL) == ErrorSevHigh &&
               error->ft->getProbableCause(error, NULL) == Timeout &&
               error->ft->getCIMStatusCode(error, NULL) == CMPI_RC_ERR_FAILED &&
               error->ft->getErrorType(error, NULL) == UnknownErrorType &&
               error->ft->getOtherErrorType(error, &rc) == NULL && isOk(rc));
    CMPIArray* list = broker->eft->newArray(broker, 1, CMPI_string, NULL);
    list->ft->setElementAt(list, 0, at("do"), CMPI_chars);
    report(call, "setErrorAttributes",
           isOk(error->ft->setErrorType(error, SoftwareError)) &&
               isOk(error->ft->setOtherErrorType(error, "other")) &&
               isOk(error->ft->setProbableCauseDescription(error, "cause")) &&
               isOk(error->ft->setRecommendedActions(error, list)) &&
               isOk(error->ft->setErrorSource(error, "source")) &&
               isOk(error->ft->setErrorSourceFormat(error, CIMObjectHandle)) &&
               isOk(error->ft->setOtherErrorSourceFormat(error, "format")) &&
               isOk(error->ft->setCIMStatusCodeDescription(error, "code")) &&
               isOk(error->ft->setMessageArguments(error, list)) &&
               error->ft->setMessageArguments(error, NULL).rc == CMPI_RC_ERR_INVALID_PARAMETER);
    CMPIError* clone = error->ft->clone(error, &rc);
    error->ft->setErrorSource(error, "changed");
    report(call, "cloneError",
           isOk(rc) && clone->ft->getErrorType(clone, NULL) == SoftwareError &&
               isText(clone->ft->getOtherErrorType(clone, NULL), "other") &&
               isText(clone->ft->getProbableCauseDescription(clone, NULL), "cause") &&
               clone->ft->getRecommendedActions(clone, NULL)
                       ->ft->getSize(clone->ft->getRecommendedActions(clone, NULL), NULL) == 1 &&
               isText(clone->ft->getErrorSource(clone, NULL), "source") &&
               clone->ft->getErrorSourceFormat(clone, NULL) == CIMObjectHandle &&
               isText(clone->ft->getOtherErrorSourceFormat(clone, NULL), "format") &&
               isText(clone->ft->getCIMStatusCodeDescription(clone, NULL), "code") &&
               clone->ft->getMessageArguments(clone, NULL) != NULL &&
               isOk(clone->ft->release(clone)) && isOk(error->ft->release(error)));
}

static void checkMemory(const Call* call) {
    CMPIStatus rc = unset();
    CMPIString* before = broker->eft->newString(broker, "before", NULL);
    CMPIObjectPath* op = broker->eft->newObjectPath(broker, "root/test", "Test_Left", NULL);
    CMPIGcStat* outer = broker->mft->mark(broker, &rc);
    int marked = isOk(rc) && outer != NULL;
    op->ft->addKey(op, "Id", at("set while marked"), CMPI_chars);
    CMPIGcStat* inner = broker->mft->mark(broker, NULL);
    CMPIString* kept = broker->eft->newString(broker, "kept", NULL);
    kept = kept->ft->clone(kept, NULL);
    report(call, "markAndRelease",
           marked && isOk(broker->mft->release(broker, outer)) &&
               broker->mft->release(broker, inner).rc == CMPI_RC_ERR_INVALID_HANDLE &&
               isText(before, "before") && isText(kept, "kept") &&
               isText(op->ft->getKey(op, "Id", NULL).value.string, "set while marked"));
    kept->ft->release(kept);
    char* block = broker->mft->cmpiMalloc(broker, 4);
    strcpy(block, "abc");
    block = broker->mft->cmpiRealloc(broker, block, 4000);
    char* copy = broker->mft->cmpiStrDup(broker, block);
    char* cleared = broker->mft->cmpiCalloc(broker, 3, 5);
    report(call, "cmpiMalloc", strcmp(copy, "abc") == 0 && cleared[14] == 0);
    broker->mft->cmpiFree(broker, block);
    broker->mft->cmpiFree(broker, NULL);
    /* The other two are left to the host, which frees them after cleanup. */
    CMPIString* freed = broker->eft->newString(broker, "freed", NULL);
    broker->mft->freeString(broker, freed);
    broker->mft->freeObjectPath(broker, op);
    report(call, "freeString", isText(before, "before"));
}

static CMPI_THREAD_KEY_TYPE key;
static CMPI_MUTEX_TYPE mutex;
static CMPI_COND_TYPE condition;
static int ready;
static int onceCalls;
static int onceState;

static void once(void) {
    ++onceCalls;
}

static CMPI_THREAD_RETURN CMPI_THREAD_CDECL inThread(void* parameter) {
    CMPIContext* context = parameter;
    if (broker->bft->attachThread(broker, context).rc != CMPI_RC_OK) {
        return NULL;
    }
    CMPIString* string = broker->eft->newString(broker, "made in a thread", NULL);
    broker->xft->setThreadSpecific(key, string);
    broker->xft->threadOnce(&onceState, once);
    broker->xft->lockMutex(mutex);
    ready = isText(broker->xft->getThreadSpecific(key), "made in a thread");
    broker->xft->signalCondition(condition);
    broker->xft->unlockMutex(mutex);
    broker->bft->detachThread(broker, context);
    return &ready;
}

static CMPI_THREAD_RETURN CMPI_THREAD_CDECL untilCancelled(void* parameter) {
    for (;;) {
        broker->xft->threadSleep(1);
    }
    return parameter;
}

static CMPI_THREAD_RETURN CMPI_THREAD_CDECL exits(void* parameter) {
    broker->xft->exitThread(parameter);
    return NULL;
}

static void checkThreads(const Call* call) {
    CMPI_THREAD_RETURN result = NULL;
    char* name = broker->xft->resolveFileName("X");
    report(call, "resolveFileName", strcmp(name, "libX.so") == 0);
    free(name);
    mutex = broker->xft->newMutex(0);
    condition = broker->xft->newCondition(0);
    ready = 0;
    int keyMade = broker->xft->createThreadKey(&key, NULL) == 0 && key < 0x100000000UL;
    CMPIContext* prepared = broker->bft->prepareAttachThread(broker, call->context);
    broker->xft->lockMutex(mutex);
    broker->xft->lockMutex(mutex);
    broker->xft->unlockMutex(mutex);
    CMPI_THREAD_TYPE thread = broker->xft->newThread(inThread, prepared, 0);
    int waited = 0;
    while (!ready && waited == 0) {
        waited = broker->xft->condWait(condition, mutex);
    }
    broker->xft->unlockMutex(mutex);
    int joined = broker->xft->joinThread(thread, &result);
    report(call, "attachedThread",
           keyMade && prepared != NULL && ready && waited == 0 && joined == 0 && result == &ready);
    broker->xft->threadOnce(&onceState, once);
    report(call, "threadOnce", onceCalls == 1);
    report(call, "attachTwice",
           broker->bft->attachThread(broker, prepared).rc == CMPI_RC_ERR_INVALID_HANDLE);
    struct timespec past = {1, 0};
    broker->xft->lockMutex(mutex);
    report(call, "timedCondWait", broker->xft->timedCondWait(condition, mutex, &past) == ETIMEDOUT);
    broker->xft->unlockMutex(mutex);
    thread = broker->xft->newThread(untilCancelled, NULL, 0);
    report(call, "cancelThread",
           broker->xft->cancelThread(thread) == 0 && broker->xft->joinThread(thread, NULL) == 0);
    thread = broker->xft->newThread(exits, &ready, 0);
    result = NULL;
    report(call, "exitThread", broker->xft->joinThread(thread, &result) == 0 && result == &ready);
    broker->xft->destroyThreadKey(key);
    broker->xft->destroyCondition(condition);
    broker->xft->destroyMutex(mutex);
    report(call, "newThreadNull", broker->xft->newThread(NULL, NULL, 0) == NULL);
}

static void checkRefusals(const Call* call) {
    CMPIStatus rc = unset();
    const CMPIBrokerFT* ask = broker->bft;
    const CMPIContext* context = call->context;
    const CMPIObjectPath* path = call->path;
    report(call, "createNothing",
           ask->createInstance(broker, context, path, NULL, &rc) == NULL &&
               rc.rc == CMPI_RC_ERR_INVALID_PARAMETER);
    report(call, "deleteNothing",
           ask->deleteInstance(broker, context, NULL).rc == CMPI_RC_ERR_INVALID_PARAMETER);
    report(call, "queryLanguage",
           ask->execQuery(broker, context, path, "SELECT * FROM Test_Left", "l", &rc) == NULL &&
               rc.rc == CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED);
    report(call, "queryNothing",
           ask->execQuery(broker, context, path, NULL, "WQL", &rc) == NULL &&
               rc.rc == CMPI_RC_ERR_INVALID_PARAMETER);
    report(call, "setUnknownProperty",
           ask->setProperty(broker, context, path, "p", NULL, CMPI_string).rc ==
               CMPI_RC_ERR_NO_SUCH_PROPERTY);
    report(call, "setPropertyOfAnotherType",
           ask->setProperty(broker, context, path, "Passed", at("x"), CMPI_chars).rc ==
               CMPI_RC_ERR_TYPE_MISMATCH);
    report(call, "setNoProperty",
           ask->setProperty(broker, context, path, NULL, NULL, CMPI_string).rc ==
               CMPI_RC_ERR_INVALID_PARAMETER);
    ask->invokeMethod(broker, context, path, "m", NULL, NULL, &rc);
    report(call, "invokeMethod", rc.rc == CMPI_RC_ERR_NOT_SUPPORTED);
    report(call, "deliverNothing",
           ask->deliverIndication(broker, context, "n", NULL).rc == CMPI_RC_ERR_INVALID_PARAMETER);
}

static CMPIStatus cleanup(CMPIInstanceMI* mi, const CMPIContext* ctx, CMPIBoolean terminating) {
    CMPIStatus status = {terminating && mi != NULL && ctx != NULL ? CMPI_RC_OK : CMPI_RC_ERR_FAILED,
                         NULL};
    return status;
}

static CMPIStatus enumerateInstances(CMPIInstanceMI* mi, const CMPIContext* ctx,
                                     const CMPIResult* rslt, const CMPIObjectPath* op,
                                     const char** properties) {
    Call call;
    call.context = ctx;
    call.result = rslt;
    call.path = op;
    (void)mi;
    (void)properties;
    checkStrings(&call);
    checkArrays(&call);
    checkDateTimes(&call);
    checkPaths(&call);
    checkInstances(&call);
    checkArgsAndContext(&call);
    checkServices(&call);
    checkErrors(&call);
    checkMemory(&call);
    checkThreads(&call);
    checkRefusals(&call);
    return rslt->ft->returnDone(rslt);
}

static CMPIInstanceMIFT table = {
    .ftVersion = CMPIVersion200,
    .miVersion = 1,
    .miName = "instanceCheck",
    .cleanup = cleanup,
    .enumerateInstances = enumerateInstances,
};
static CMPIInstanceMI record = {NULL, &table};

/* Never writes the status, as factories of older stub macros. */
CMPI_EXTERN_C CMPIInstanceMI* Check_Create_InstanceMI(const CMPIBroker* mb, const CMPIContext* ctx,
                                                      CMPIStatus* rc) {
    (void)ctx;
    (void)rc;
    broker = mb;
    return &record;
}

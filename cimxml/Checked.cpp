#include "Checked.h"

namespace cimxml {

namespace {

// `at` is a slot that also yields the name.
template <class Object, class At>
NamedData namedAt(const Object* object, CMPICount index, const At& at, const char* what) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    CMPIString* name = nullptr;
    const CMPIData data = at(object, index, &name, &status);
    require(status, what);
    return {textOf(name), data};
}

} // namespace

void require(const CMPIStatus& status, const std::string& what) {
    if (status.rc != CMPI_RC_OK) {
        throw CimError(status.rc, what + (status.msg != nullptr ? ": " + textOf(status.msg) : ""));
    }
}

std::string textOf(const CMPIString* string) {
    const char* const chars = string != nullptr ? CMGetCharsPtr(string, nullptr) : nullptr;
    if (chars == nullptr) {
        throw CimError(CMPI_RC_ERR_FAILED, "the broker returned no text");
    }
    return chars;
}

std::string classNameOf(const CMPIObjectPath* path) {
    return textOf(checked("class name", CMGetClassName, path));
}

CMPIObjectPath* pathOf(const CMPIInstance* instance) {
    return checked("path of an instance", CMGetObjectPath, instance);
}

NamedData keyAt(const CMPIObjectPath* path, CMPICount index) {
    return namedAt(path, index, CMGetKeyAt, "key");
}

NamedData propertyAt(const CMPIInstance* instance, CMPICount index) {
    return namedAt(instance, index, CMGetPropertyAt, "property");
}

NamedData argumentAt(const CMPIArgs* arguments, CMPICount index) {
    return namedAt(arguments, index, CMGetArgAt, "argument");
}

} // namespace cimxml

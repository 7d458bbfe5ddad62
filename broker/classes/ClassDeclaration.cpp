// What a program says of a class before it is declared. Nothing is checked here: the broker checks a
// declaration when it is declared, since only then the superclass is known.

#include "Declarations.h"
#include "classes/NamedDeclaration.h"

namespace oxahv {

namespace {

QualifierDeclaration trueQualifier(const char* name) {
    return {name, {CMPI_boolean, false, {PlainValue(true)}}};
}

} // namespace

ClassDeclaration::ClassDeclaration(std::string name) : name_(std::move(name)) {}

ClassDeclaration& ClassDeclaration::superclass(std::string name) {
    superclass_ = std::move(name);
    return *this;
}

ClassDeclaration& ClassDeclaration::association() {
    return qualifier(trueQualifier("Association"));
}

ClassDeclaration& ClassDeclaration::abstract() {
    QualifierDeclaration abstract = trueQualifier("Abstract");
    abstract.reachesSubclass = false;
    return qualifier(std::move(abstract));
}

ClassDeclaration& ClassDeclaration::qualifier(QualifierDeclaration qualifier) {
    std::vector<QualifierDeclaration> all = qualifiers_.list();
    all.push_back(std::move(qualifier));
    qualifiers_ = Qualifiers(std::move(all));
    return *this;
}

ClassDeclaration& ClassDeclaration::qualifiers(Qualifiers list) {
    qualifiers_ = std::move(list);
    return *this;
}

ClassDeclaration& ClassDeclaration::key(std::string name, CMPIType type) {
    return property({std::move(name), type, true, {}, {}, Qualifiers({trueQualifier("Key")})});
}

ClassDeclaration& ClassDeclaration::property(std::string name, CMPIType type) {
    return property(PropertyDeclaration{std::move(name), type});
}

ClassDeclaration& ClassDeclaration::property(PropertyDeclaration property) {
    properties_.push_back(std::move(property));
    return *this;
}

ClassDeclaration& ClassDeclaration::reference(std::string name, std::string className) {
    return property({std::move(name), CMPI_ref, false, std::move(className)});
}

ClassDeclaration& ClassDeclaration::method(std::string name, CMPIType returnType,
                                           std::vector<ParameterDeclaration> parameters) {
    return method({std::move(name), returnType, std::move(parameters)});
}

ClassDeclaration& ClassDeclaration::method(MethodDeclaration method) {
    methods_.push_back(std::move(method));
    return *this;
}

bool ClassDeclaration::isAssociation() const {
    return qualifiers_.isTrue("Association");
}

bool ClassDeclaration::isAbstract() const {
    return qualifiers_.isTrue("Abstract");
}

const ParameterDeclaration* MethodDeclaration::find(std::string_view parameter) const {
    return named(parameters, parameter);
}

} // namespace oxahv

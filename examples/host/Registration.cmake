# The provider's registration with CIM servers, in the two forms that they take, from one list.

set(OXAHV_HOST_NAMESPACE root/cimv2 CACHE STRING "The namespace that the example provider is registered for")

# Each class, and the provider types that serve it.
set(oxahost_classes
    "OXATK_ComputerSystem: instance method"
    "OXATK_OperatingSystem: instance"
    "OXATK_EthernetPort: instance"
    "OXATK_NumericSensor: instance"
    "OXATK_AssetIDDetails: instance"
    "OXATK_RunningOS: instance association")

# The numbers of the types in the form of instances.
set(oxahost_type_instance 2)
set(oxahost_type_association 3)
set(oxahost_type_method 5)

set(OXAHOST_PROVIDER OXAHostProvider)
set(OXAHOST_LOCATION ${OXAHOST_PROVIDER})
set(OXAHOST_SECTIONS)
set(OXAHOST_CAPABILITIES)
set(capability 0)
foreach(entry IN LISTS oxahost_classes)
    string(REGEX MATCH "^([^:]+): (.*)$" entry "${entry}")
    set(class ${CMAKE_MATCH_1})
    set(types ${CMAKE_MATCH_2})
    string(APPEND OXAHOST_SECTIONS "
[${class}]
    provider: ${OXAHOST_PROVIDER}
    location: ${OXAHOST_LOCATION}
    type: ${types}
    unload: never
    namespace: ${OXAHV_HOST_NAMESPACE}
")
    set(numbers)
    separate_arguments(types)
    foreach(type IN LISTS types)
        list(APPEND numbers ${oxahost_type_${type}})
    endforeach()
    list(JOIN numbers ", " numbers)
    math(EXPR capability "${capability} + 1")
    string(APPEND OXAHOST_CAPABILITIES "
instance of PG_ProviderCapabilities {
    ProviderModuleName = \"${OXAHOST_PROVIDER}Module\";
    ProviderName = \"${OXAHOST_PROVIDER}\";
    CapabilityID = \"${capability}\";
    ClassName = \"${class}\";
    Namespaces = {\"${OXAHV_HOST_NAMESPACE}\"};
    ProviderType = {${numbers}};
};
")
endforeach()

set(oxahost_registration ${CMAKE_CURRENT_BINARY_DIR}/registration)
foreach(file OXAHost.reg OXAHostRegistration.mof)
    configure_file(${CMAKE_CURRENT_SOURCE_DIR}/${file}.in ${oxahost_registration}/${file} @ONLY)
endforeach()

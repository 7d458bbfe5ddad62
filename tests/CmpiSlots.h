// The functions of CMPI's tables in the order of memory, but for those that all tables of a kind begin with.
#pragma once

#include <cmpift.h>

template <auto... slots>
struct Slots {};

// What a version has added to a list.
#if CMPI_VERSION >= 200
#define SINCE_200(...) , __VA_ARGS__
#else
#define SINCE_200(...)
#endif
#if CMPI_VERSION >= 210
#define SINCE_210(...) , __VA_ARGS__
#else
#define SINCE_210(...)
#endif

using RequestSlots =
    Slots<&CMPIBrokerFT::prepareAttachThread, &CMPIBrokerFT::attachThread, &CMPIBrokerFT::detachThread,
          &CMPIBrokerFT::deliverIndication, &CMPIBrokerFT::enumerateInstanceNames, &CMPIBrokerFT::getInstance,
          &CMPIBrokerFT::createInstance, &CMPIBrokerFT::modifyInstance, &CMPIBrokerFT::deleteInstance,
          &CMPIBrokerFT::execQuery, &CMPIBrokerFT::enumerateInstances, &CMPIBrokerFT::associators,
          &CMPIBrokerFT::associatorNames, &CMPIBrokerFT::references, &CMPIBrokerFT::referenceNames,
          &CMPIBrokerFT::invokeMethod, &CMPIBrokerFT::setProperty,
          &CMPIBrokerFT::getProperty SINCE_210(&CMPIBrokerFT::enumerateInstancesFiltered,
                                               &CMPIBrokerFT::associatorsFiltered,
                                               &CMPIBrokerFT::referencesFiltered)>;
using EncapsulationSlots =
    Slots<&CMPIBrokerEncFT::newInstance, &CMPIBrokerEncFT::newObjectPath, &CMPIBrokerEncFT::newArgs,
          &CMPIBrokerEncFT::newString, &CMPIBrokerEncFT::newArray, &CMPIBrokerEncFT::newDateTime,
          &CMPIBrokerEncFT::newDateTimeFromBinary, &CMPIBrokerEncFT::newDateTimeFromChars,
          &CMPIBrokerEncFT::newSelectExp, &CMPIBrokerEncFT::classPathIsA, &CMPIBrokerEncFT::toString,
          &CMPIBrokerEncFT::isOfType, &CMPIBrokerEncFT::getType, &CMPIBrokerEncFT::getMessage,
          &CMPIBrokerEncFT::logMessage,
          &CMPIBrokerEncFT::trace SINCE_200(&CMPIBrokerEncFT::newCMPIError, &CMPIBrokerEncFT::openMessageFile,
                                            &CMPIBrokerEncFT::closeMessageFile, &CMPIBrokerEncFT::getMessage2)
              SINCE_210(&CMPIBrokerEncFT::newPropertyList, &CMPIBrokerEncFT::newStringCP,
                        &CMPIBrokerEncFT::newEnumerationFilter)>;
using SystemSlots =
    Slots<&CMPIBrokerExtFT::resolveFileName, &CMPIBrokerExtFT::newThread, &CMPIBrokerExtFT::joinThread,
          &CMPIBrokerExtFT::exitThread, &CMPIBrokerExtFT::cancelThread, &CMPIBrokerExtFT::threadSleep,
          &CMPIBrokerExtFT::threadOnce, &CMPIBrokerExtFT::createThreadKey, &CMPIBrokerExtFT::destroyThreadKey,
          &CMPIBrokerExtFT::getThreadSpecific, &CMPIBrokerExtFT::setThreadSpecific,
          &CMPIBrokerExtFT::newMutex, &CMPIBrokerExtFT::destroyMutex, &CMPIBrokerExtFT::lockMutex,
          &CMPIBrokerExtFT::unlockMutex, &CMPIBrokerExtFT::newCondition, &CMPIBrokerExtFT::destroyCondition,
          &CMPIBrokerExtFT::condWait, &CMPIBrokerExtFT::timedCondWait,
          &CMPIBrokerExtFT::signalCondition SINCE_210(
              &CMPIBrokerExtFT::destroyMutex2, &CMPIBrokerExtFT::lockMutex2, &CMPIBrokerExtFT::unlockMutex2,
              &CMPIBrokerExtFT::destroyCondition2)>;
using MemorySlots =
    Slots<&CMPIBrokerMemFT::mark, &CMPIBrokerMemFT::release, &CMPIBrokerMemFT::cmpiMalloc,
          &CMPIBrokerMemFT::cmpiCalloc, &CMPIBrokerMemFT::cmpiRealloc, &CMPIBrokerMemFT::cmpiStrDup,
          &CMPIBrokerMemFT::cmpiFree, &CMPIBrokerMemFT::freeInstance, &CMPIBrokerMemFT::freeObjectPath,
          &CMPIBrokerMemFT::freeArgs, &CMPIBrokerMemFT::freeString, &CMPIBrokerMemFT::freeArray,
          &CMPIBrokerMemFT::freeDateTime,
          &CMPIBrokerMemFT::freeSelectExp SINCE_210(&CMPIBrokerMemFT::freeChars)>;
using ContextSlots = Slots<&CMPIContextFT::getEntry, &CMPIContextFT::getEntryAt,
                           &CMPIContextFT::getEntryCount, &CMPIContextFT::addEntry>;
using ResultSlots =
    Slots<&CMPIResultFT::returnData, &CMPIResultFT::returnInstance, &CMPIResultFT::returnObjectPath,
          &CMPIResultFT::returnDone SINCE_200(&CMPIResultFT::returnError)>;
using StringSlots = Slots<&CMPIStringFT::getCharPtr SINCE_210(&CMPIStringFT::newCharsCP)>;
using ArraySlots = Slots<&CMPIArrayFT::getSize, &CMPIArrayFT::getSimpleType, &CMPIArrayFT::getElementAt,
                         &CMPIArrayFT::setElementAt>;
using EnumerationSlots =
    Slots<&CMPIEnumerationFT::getNext, &CMPIEnumerationFT::hasNext, &CMPIEnumerationFT::toArray>;
using InstanceSlots =
    Slots<&CMPIInstanceFT::getProperty, &CMPIInstanceFT::getPropertyAt, &CMPIInstanceFT::getPropertyCount,
          &CMPIInstanceFT::setProperty, &CMPIInstanceFT::getObjectPath, &CMPIInstanceFT::setPropertyFilter,
          &CMPIInstanceFT::setObjectPath SINCE_200(&CMPIInstanceFT::setPropertyWithOrigin)>;
using ObjectPathSlots =
    Slots<&CMPIObjectPathFT::setNameSpace, &CMPIObjectPathFT::getNameSpace, &CMPIObjectPathFT::setHostname,
          &CMPIObjectPathFT::getHostname, &CMPIObjectPathFT::setClassName, &CMPIObjectPathFT::getClassName,
          &CMPIObjectPathFT::addKey, &CMPIObjectPathFT::getKey, &CMPIObjectPathFT::getKeyAt,
          &CMPIObjectPathFT::getKeyCount, &CMPIObjectPathFT::setNameSpaceFromObjectPath,
          &CMPIObjectPathFT::setHostAndNameSpaceFromObjectPath, &CMPIObjectPathFT::getClassQualifier,
          &CMPIObjectPathFT::getPropertyQualifier, &CMPIObjectPathFT::getMethodQualifier,
          &CMPIObjectPathFT::getParameterQualifier, &CMPIObjectPathFT::toString>;
using ArgsSlots =
    Slots<&CMPIArgsFT::addArg, &CMPIArgsFT::getArg, &CMPIArgsFT::getArgAt, &CMPIArgsFT::getArgCount>;
using DateTimeSlots =
    Slots<&CMPIDateTimeFT::getBinaryFormat, &CMPIDateTimeFT::getStringFormat, &CMPIDateTimeFT::isInterval>;
using ErrorSlots =
    Slots<&CMPIErrorFT::getErrorType, &CMPIErrorFT::getOtherErrorType, &CMPIErrorFT::getOwningEntity,
          &CMPIErrorFT::getMessageID, &CMPIErrorFT::getMessage, &CMPIErrorFT::getPerceivedSeverity,
          &CMPIErrorFT::getProbableCause, &CMPIErrorFT::getProbableCauseDescription,
          &CMPIErrorFT::getRecommendedActions, &CMPIErrorFT::getErrorSource,
          &CMPIErrorFT::getErrorSourceFormat, &CMPIErrorFT::getOtherErrorSourceFormat,
          &CMPIErrorFT::getCIMStatusCode, &CMPIErrorFT::getCIMStatusCodeDescription,
          &CMPIErrorFT::getMessageArguments, &CMPIErrorFT::setErrorType, &CMPIErrorFT::setOtherErrorType,
          &CMPIErrorFT::setProbableCauseDescription, &CMPIErrorFT::setRecommendedActions,
          &CMPIErrorFT::setErrorSource, &CMPIErrorFT::setErrorSourceFormat,
          &CMPIErrorFT::setOtherErrorSourceFormat, &CMPIErrorFT::setCIMStatusCodeDescription,
          &CMPIErrorFT::setMessageArguments>;
#if CMPI_VERSION >= 210
using PropertyListSlots = Slots<&CMPIPropertyListFT::isPropertyInList, &CMPIPropertyListFT::getProperties>;
using EnumerationFilterSlots = Slots<&CMPIEnumerationFilterFT::match>;
#endif
using InstanceMISlots =
    Slots<&CMPIInstanceMIFT::enumerateInstanceNames, &CMPIInstanceMIFT::enumerateInstances,
          &CMPIInstanceMIFT::getInstance, &CMPIInstanceMIFT::createInstance,
          &CMPIInstanceMIFT::modifyInstance, &CMPIInstanceMIFT::deleteInstance,
          &CMPIInstanceMIFT::execQuery SINCE_210(&CMPIInstanceMIFT::enumerateInstancesFiltered)>;
using AssociationMISlots =
    Slots<&CMPIAssociationMIFT::associators, &CMPIAssociationMIFT::associatorNames,
          &CMPIAssociationMIFT::references,
          &CMPIAssociationMIFT::referenceNames SINCE_210(&CMPIAssociationMIFT::associatorsFiltered,
                                                         &CMPIAssociationMIFT::referencesFiltered)>;
using MethodMISlots = Slots<&CMPIMethodMIFT::invokeMethod>;
using PropertyMISlots = Slots<&CMPIPropertyMIFT::setProperty, &CMPIPropertyMIFT::getProperty>;
using IndicationMISlots =
    Slots<&CMPIIndicationMIFT::authorizeFilter, &CMPIIndicationMIFT::mustPoll,
          &CMPIIndicationMIFT::activateFilter, &CMPIIndicationMIFT::deActivateFilter,
          &CMPIIndicationMIFT::enableIndications, &CMPIIndicationMIFT::disableIndications>;

// What tests put between a caller and a slot: faults and the record of calls.
#pragma once

#include "EmbeddedBroker.h"

#include <atomic>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

namespace oxahv {

// Every slot that takes a handle, table by table in the order of memory.
constexpr std::string_view slots[] = {
    "CMPIBrokerFT.prepareAttachThread",
    "CMPIBrokerFT.attachThread",
    "CMPIBrokerFT.detachThread",
    "CMPIBrokerFT.deliverIndication",
    "CMPIBrokerFT.enumerateInstanceNames",
    "CMPIBrokerFT.getInstance",
    "CMPIBrokerFT.createInstance",
    "CMPIBrokerFT.modifyInstance",
    "CMPIBrokerFT.deleteInstance",
    "CMPIBrokerFT.execQuery",
    "CMPIBrokerFT.enumerateInstances",
    "CMPIBrokerFT.associators",
    "CMPIBrokerFT.associatorNames",
    "CMPIBrokerFT.references",
    "CMPIBrokerFT.referenceNames",
    "CMPIBrokerFT.invokeMethod",
    "CMPIBrokerFT.setProperty",
    "CMPIBrokerFT.getProperty",
    "CMPIBrokerFT.enumerateInstancesFiltered",
    "CMPIBrokerFT.associatorsFiltered",
    "CMPIBrokerFT.referencesFiltered",
    "CMPIBrokerEncFT.newInstance",
    "CMPIBrokerEncFT.newObjectPath",
    "CMPIBrokerEncFT.newArgs",
    "CMPIBrokerEncFT.newString",
    "CMPIBrokerEncFT.newArray",
    "CMPIBrokerEncFT.newDateTime",
    "CMPIBrokerEncFT.newDateTimeFromBinary",
    "CMPIBrokerEncFT.newDateTimeFromChars",
    "CMPIBrokerEncFT.newSelectExp",
    "CMPIBrokerEncFT.classPathIsA",
    "CMPIBrokerEncFT.toString",
    "CMPIBrokerEncFT.isOfType",
    "CMPIBrokerEncFT.getType",
    "CMPIBrokerEncFT.getMessage",
    "CMPIBrokerEncFT.logMessage",
    "CMPIBrokerEncFT.trace",
    "CMPIBrokerEncFT.newCMPIError",
    "CMPIBrokerEncFT.openMessageFile",
    "CMPIBrokerEncFT.closeMessageFile",
    "CMPIBrokerEncFT.getMessage2",
    "CMPIBrokerEncFT.newPropertyList",
    "CMPIBrokerEncFT.newStringCP",
    "CMPIBrokerEncFT.newEnumerationFilter",
    "CMPIBrokerMemFT.mark",
    "CMPIBrokerMemFT.release",
    "CMPIBrokerMemFT.cmpiMalloc",
    "CMPIBrokerMemFT.cmpiCalloc",
    "CMPIBrokerMemFT.cmpiRealloc",
    "CMPIBrokerMemFT.cmpiStrDup",
    "CMPIBrokerMemFT.cmpiFree",
    "CMPIBrokerMemFT.freeInstance",
    "CMPIBrokerMemFT.freeObjectPath",
    "CMPIBrokerMemFT.freeArgs",
    "CMPIBrokerMemFT.freeString",
    "CMPIBrokerMemFT.freeArray",
    "CMPIBrokerMemFT.freeDateTime",
    "CMPIBrokerMemFT.freeSelectExp",
    "CMPIBrokerMemFT.freeChars",
    "CMPIContextFT.release",
    "CMPIContextFT.clone",
    "CMPIContextFT.getEntry",
    "CMPIContextFT.getEntryAt",
    "CMPIContextFT.getEntryCount",
    "CMPIContextFT.addEntry",
    "CMPIResultFT.release",
    "CMPIResultFT.clone",
    "CMPIResultFT.returnData",
    "CMPIResultFT.returnInstance",
    "CMPIResultFT.returnObjectPath",
    "CMPIResultFT.returnDone",
    "CMPIResultFT.returnError",
    "CMPIStringFT.release",
    "CMPIStringFT.clone",
    "CMPIStringFT.getCharPtr",
    "CMPIStringFT.newCharsCP",
    "CMPIArrayFT.release",
    "CMPIArrayFT.clone",
    "CMPIArrayFT.getSize",
    "CMPIArrayFT.getSimpleType",
    "CMPIArrayFT.getElementAt",
    "CMPIArrayFT.setElementAt",
    "CMPIEnumerationFT.release",
    "CMPIEnumerationFT.clone",
    "CMPIEnumerationFT.getNext",
    "CMPIEnumerationFT.hasNext",
    "CMPIEnumerationFT.toArray",
    "CMPIInstanceFT.release",
    "CMPIInstanceFT.clone",
    "CMPIInstanceFT.getProperty",
    "CMPIInstanceFT.getPropertyAt",
    "CMPIInstanceFT.getPropertyCount",
    "CMPIInstanceFT.setProperty",
    "CMPIInstanceFT.getObjectPath",
    "CMPIInstanceFT.setPropertyFilter",
    "CMPIInstanceFT.setObjectPath",
    "CMPIInstanceFT.setPropertyWithOrigin",
    "CMPIObjectPathFT.release",
    "CMPIObjectPathFT.clone",
    "CMPIObjectPathFT.setNameSpace",
    "CMPIObjectPathFT.getNameSpace",
    "CMPIObjectPathFT.setHostname",
    "CMPIObjectPathFT.getHostname",
    "CMPIObjectPathFT.setClassName",
    "CMPIObjectPathFT.getClassName",
    "CMPIObjectPathFT.addKey",
    "CMPIObjectPathFT.getKey",
    "CMPIObjectPathFT.getKeyAt",
    "CMPIObjectPathFT.getKeyCount",
    "CMPIObjectPathFT.setNameSpaceFromObjectPath",
    "CMPIObjectPathFT.setHostAndNameSpaceFromObjectPath",
    "CMPIObjectPathFT.getClassQualifier",
    "CMPIObjectPathFT.getPropertyQualifier",
    "CMPIObjectPathFT.getMethodQualifier",
    "CMPIObjectPathFT.getParameterQualifier",
    "CMPIObjectPathFT.toString",
    "CMPIArgsFT.release",
    "CMPIArgsFT.clone",
    "CMPIArgsFT.addArg",
    "CMPIArgsFT.getArg",
    "CMPIArgsFT.getArgAt",
    "CMPIArgsFT.getArgCount",
    "CMPIDateTimeFT.release",
    "CMPIDateTimeFT.clone",
    "CMPIDateTimeFT.getBinaryFormat",
    "CMPIDateTimeFT.getStringFormat",
    "CMPIDateTimeFT.isInterval",
    "CMPIErrorFT.release",
    "CMPIErrorFT.clone",
    "CMPIErrorFT.getErrorType",
    "CMPIErrorFT.getOtherErrorType",
    "CMPIErrorFT.getOwningEntity",
    "CMPIErrorFT.getMessageID",
    "CMPIErrorFT.getMessage",
    "CMPIErrorFT.getPerceivedSeverity",
    "CMPIErrorFT.getProbableCause",
    "CMPIErrorFT.getProbableCauseDescription",
    "CMPIErrorFT.getRecommendedActions",
    "CMPIErrorFT.getErrorSource",
    "CMPIErrorFT.getErrorSourceFormat",
    "CMPIErrorFT.getOtherErrorSourceFormat",
    "CMPIErrorFT.getCIMStatusCode",
    "CMPIErrorFT.getCIMStatusCodeDescription",
    "CMPIErrorFT.getMessageArguments",
    "CMPIErrorFT.setErrorType",
    "CMPIErrorFT.setOtherErrorType",
    "CMPIErrorFT.setProbableCauseDescription",
    "CMPIErrorFT.setRecommendedActions",
    "CMPIErrorFT.setErrorSource",
    "CMPIErrorFT.setErrorSourceFormat",
    "CMPIErrorFT.setOtherErrorSourceFormat",
    "CMPIErrorFT.setCIMStatusCodeDescription",
    "CMPIErrorFT.setMessageArguments",
    "CMPIPropertyListFT.release",
    "CMPIPropertyListFT.clone",
    "CMPIPropertyListFT.isPropertyInList",
    "CMPIPropertyListFT.getProperties",
    "CMPISelectExpFT.release",
    "CMPISelectExpFT.clone",
    "CMPISelectExpFT.evaluate",
    "CMPISelectExpFT.getString",
    "CMPISelectExpFT.getDOC",
    "CMPISelectExpFT.getCOD",
    "CMPISelectExpFT.evaluateUsingAccessor",
    "CMPISelectCondFT.release",
    "CMPISelectCondFT.clone",
    "CMPISelectCondFT.getCountAndType",
    "CMPISelectCondFT.getSubCondAt",
    "CMPISubCondFT.release",
    "CMPISubCondFT.clone",
    "CMPISubCondFT.getCount",
    "CMPISubCondFT.getPredicateAt",
    "CMPISubCondFT.getPredicate",
    "CMPIPredicateFT.release",
    "CMPIPredicateFT.clone",
    "CMPIPredicateFT.getData",
    "CMPIPredicateFT.evaluateUsingAccessor",
};
constexpr std::size_t slotCount = sizeof slots / sizeof slots[0];

// The position of a slot; a name that is not there does not compile.
constexpr std::size_t slotIndex(std::string_view name) {
    for (std::size_t i = 0; i < slotCount; ++i) {
        if (slots[i] == name) {
            return i;
        }
    }
    throw "no such slot";
}

class Hooks {
public:
    // Whether a slot has anything to ask here. Read before every call.
    bool active() const { return active_.load(std::memory_order_relaxed) && !isPaused(); }

    // Keeps the calling thread's calls away while it lives: they are the program's own, not the provider's.
    class Pause {
    public:
        Pause();
        ~Pause();
        Pause(const Pause&) = delete;
        Pause& operator=(const Pause&) = delete;
    };

    void inject(const std::string& slot, const Fault& fault);
    void clearFaults();
    void startRecording();
    std::vector<Call> stopRecording();

    // Counts the call; the faults that strike it, as one. Its code is CMPI_RC_OK when none replaces the call.
    Fault strike(std::size_t slot);
    void record(Call&& call);

private:
    struct Injected {
        std::size_t slot; // slotCount for any
        Fault fault;
        unsigned int counted = 0; // calls since it was injected
    };

    void update();
    static bool isPaused();

    std::atomic<bool> active_{false};
    std::mutex mutex_;
    std::vector<Injected> injected_;
    bool isRecording_ = false;
    std::vector<Call> calls_;
};

} // namespace oxahv

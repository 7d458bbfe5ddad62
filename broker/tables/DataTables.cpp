// The function tables of strings, arrays, date/times, arguments, contexts, enumerations, results, property
// lists and errors.

#include "tables/Slots.h"
#include "text/DateTimeText.h"

namespace oxahv {

namespace {

// Strings

const char* getChars(const String& string) {
    string.keep();
    return string.text.c_str();
}

// UTF-8 is the only encoding here.
char* newCharsIn(const String& /*string*/, CMPICodepageID /*codepage*/) {
    throw Failure{CMPI_RC_ERR_NOT_SUPPORTED};
}

// Arrays

CMPICount getSize(const Array& array) {
    return static_cast<CMPICount>(array.elements.size());
}

CMPIType getElementType(const Array& array) {
    return array.elementType;
}

const Value& elementAt(const Array& array, CMPICount index) {
    if (index >= array.elements.size()) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    return array.elements[index];
}

CMPIData getElement(const Array& array, CMPICount index) {
    return lent(array, elementAt(array, index).data());
}

void setElement(Array& array, CMPICount index, const CMPIValue* value, CMPIType type) {
    elementAt(array, index);
    array.elements[index] = checkedValue(array.core(), value, type, {array.elementType, {}});
}

// Date/times

CMPIUint64 getBinary(const DateTime& dateTime) {
    return binaryOf(dateTime.text);
}

CMPIString* getText(const DateTime& dateTime) {
    return newText(dateTime.core(), dateTime.text);
}

CMPIBoolean isInterval(const DateTime& dateTime) {
    return isIntervalText(dateTime.text) ? 1 : 0;
}

// Values by name: arguments and contexts

CMPIData valueNamed(const NamedValues& values, const char* name) {
    const std::optional<NamedValue> found = values.find(required(name));
    if (!found) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    return found->value.data();
}

CMPIData valueAt(Core& core, const NamedValues& values, CMPICount index, CMPIString** name) {
    const NamedValue found = values.at(index);
    if (name != nullptr) {
        *name = newText(core, found.name);
    }
    return found.value.data();
}

template <class Container>
CMPIData getNamed(const Container& container, const char* name) {
    return valueNamed(container.values, name);
}

template <class Container>
CMPIData getAt(const Container& container, CMPICount index, CMPIString** name) {
    return valueAt(container.core(), container.values, index, name);
}

template <class Container>
CMPICount getCount(const Container& container) {
    return static_cast<CMPICount>(container.values.size());
}

template <class Container>
void addNamed(Container& container, const char* name, const CMPIValue* value, CMPIType type) {
    container.values.set(required(name), Value::from(container.core(), value, type));
}

// Enumerations

CMPIBoolean hasNext(const Enumeration& enumeration) {
    return enumeration.next < enumeration.elements.size() ? 1 : 0;
}

CMPIData getNext(Enumeration& enumeration) {
    if (hasNext(enumeration) == 0) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    return enumeration.elements[enumeration.next++].data();
}

CMPIArray* toArray(const Enumeration& enumeration) {
    auto array = std::make_unique<Array>(enumeration.core(), enumeration.elementType, 0);
    array->elements = enumeration.elements;
    return handOut(std::move(array));
}

// Results: what the provider returns is copied at once.

template <class Class, class Record>
void returnObject(Result& result, const Record* handle) {
    const Class* const object = Class::of(handle);
    if (object == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    result.add(*object);
}

// The value is kept in an array of one.
void returnData(Result& result, const CMPIValue* value, CMPIType type) {
    auto holder = std::make_unique<Array>(result.core(), type, 0);
    holder->elements.push_back(Value::from(result.core(), value, type));
    result.reply.data.push_back(holder->elements.front().data());
    result.keeper.adopt(std::move(holder));
}

void returnDone(Result& result) {
    result.reply.done = true;
}

void returnError(Result& result, const CMPIError* handle) {
    const Error* const error = Error::of(handle);
    if (error == nullptr) {
        throw Failure{CMPI_RC_ERR_INVALID_HANDLE};
    }
    std::unique_ptr<Object> copy = error->clone();
    result.reply.errors.push_back(static_cast<Error*>(copy.get()));
    result.keeper.adopt(std::move(copy));
    result.reply.code = error->statusCode;
    result.reply.message = error->message;
}

// Property lists

CMPIBoolean isInList(const PropertyList& list, const char* name) {
    required(name);
    for (const std::string& wanted : list.names) {
        if (sameName(wanted, name)) {
            return 1;
        }
    }
    return 0;
}

const char** getNames(PropertyList& list) {
    return list.pointers.data();
}

// Errors: a getter and a setter for each field.

template <auto field>
auto getField(const Error& error) {
    return error.*field;
}

template <std::string Error::*field>
CMPIString* getTextField(const Error& error) {
    return newText(error.core(), error.*field);
}

template <Value Error::*field>
CMPIArray* getArrayField(const Error& error) {
    const CMPIData data = (error.*field).data();
    if (CMIsNullValue(data)) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    return data.value.array;
}

template <auto field, class Code>
void setField(Error& error, Code code) {
    error.*field = code;
}

template <std::string Error::*field>
void setTextField(Error& error, const char* text) {
    error.*field = required(text);
}

template <Value Error::*field>
void setArrayField(Error& error, const CMPIArray* array) {
    CMPIValue value = {};
    value.array = const_cast<CMPIArray*>(array);
    error.*field = Value::from(error.core(), &value, CMPI_stringA);
}

} // namespace

const CMPIStringFT String::table = {
    CMPICurrentVersion,
    SLOT(CMPIStringFT, release, releaseObject<String>),
    SLOT(CMPIStringFT, clone, cloneObject<String>),
    SLOT(CMPIStringFT, getCharPtr, getChars),
    SLOT(CMPIStringFT, newCharsCP, newCharsIn),
};

const CMPIArrayFT Array::table = {
    CMPICurrentVersion,
    SLOT(CMPIArrayFT, release, releaseObject<Array>),
    SLOT(CMPIArrayFT, clone, cloneObject<Array>),
    SLOT(CMPIArrayFT, getSize, getSize),
    SLOT(CMPIArrayFT, getSimpleType, getElementType),
    SLOT(CMPIArrayFT, getElementAt, getElement),
    SLOT(CMPIArrayFT, setElementAt, setElement),
};

const CMPIDateTimeFT DateTime::table = {
    CMPICurrentVersion,
    SLOT(CMPIDateTimeFT, release, releaseObject<DateTime>),
    SLOT(CMPIDateTimeFT, clone, cloneObject<DateTime>),
    SLOT(CMPIDateTimeFT, getBinaryFormat, getBinary),
    SLOT(CMPIDateTimeFT, getStringFormat, getText),
    SLOT(CMPIDateTimeFT, isInterval, isInterval),
};

const CMPIArgsFT Arguments::table = {
    CMPICurrentVersion,
    SLOT(CMPIArgsFT, release, releaseObject<Arguments>),
    SLOT(CMPIArgsFT, clone, cloneObject<Arguments>),
    SLOT(CMPIArgsFT, addArg, addNamed<Arguments>),
    SLOT(CMPIArgsFT, getArg, getNamed<Arguments>),
    SLOT(CMPIArgsFT, getArgAt, getAt<Arguments>),
    SLOT(CMPIArgsFT, getArgCount, getCount<Arguments>),
};

const CMPIContextFT Context::table = {
    CMPICurrentVersion,
    SLOT(CMPIContextFT, release, releaseObject<Context>),
    SLOT(CMPIContextFT, clone, cloneObject<Context>),
    SLOT(CMPIContextFT, getEntry, getNamed<Context>),
    SLOT(CMPIContextFT, getEntryAt, getAt<Context>),
    SLOT(CMPIContextFT, getEntryCount, getCount<Context>),
    SLOT(CMPIContextFT, addEntry, addNamed<Context>),
};

const CMPIEnumerationFT Enumeration::table = {
    CMPICurrentVersion,
    SLOT(CMPIEnumerationFT, release, releaseObject<Enumeration>),
    SLOT(CMPIEnumerationFT, clone, cloneObject<Enumeration>),
    SLOT(CMPIEnumerationFT, getNext, getNext),
    SLOT(CMPIEnumerationFT, hasNext, hasNext),
    SLOT(CMPIEnumerationFT, toArray, toArray),
};

const CMPIResultFT Result::table = {
    CMPICurrentVersion,
    SLOT(CMPIResultFT, release, releaseObject<Result>),
    SLOT(CMPIResultFT, clone, cloneObject<Result>),
    SLOT(CMPIResultFT, returnData, returnData),
    SLOT(CMPIResultFT, returnInstance, (returnObject<Instance, CMPIInstance>)),
    SLOT(CMPIResultFT, returnObjectPath, (returnObject<ObjectPath, CMPIObjectPath>)),
    SLOT(CMPIResultFT, returnDone, returnDone),
    SLOT(CMPIResultFT, returnError, returnError),
};

const CMPIPropertyListFT PropertyList::table = {
    CMPICurrentVersion,
    SLOT(CMPIPropertyListFT, release, releaseObject<PropertyList>),
    SLOT(CMPIPropertyListFT, clone, cloneObject<PropertyList>),
    SLOT(CMPIPropertyListFT, isPropertyInList, isInList),
    SLOT(CMPIPropertyListFT, getProperties, getNames),
};

const CMPIErrorFT Error::table = {
    CMPICurrentVersion,
    SLOT(CMPIErrorFT, release, releaseObject<Error>),
    SLOT(CMPIErrorFT, clone, cloneObject<Error>),
    SLOT(CMPIErrorFT, getErrorType, getField<&Error::type>),
    SLOT(CMPIErrorFT, getOtherErrorType, getTextField<&Error::otherType>),
    SLOT(CMPIErrorFT, getOwningEntity, getTextField<&Error::owningEntity>),
    SLOT(CMPIErrorFT, getMessageID, getTextField<&Error::messageId>),
    SLOT(CMPIErrorFT, getMessage, getTextField<&Error::message>),
    SLOT(CMPIErrorFT, getPerceivedSeverity, getField<&Error::severity>),
    SLOT(CMPIErrorFT, getProbableCause, getField<&Error::probableCause>),
    SLOT(CMPIErrorFT, getProbableCauseDescription, getTextField<&Error::probableCauseDescription>),
    SLOT(CMPIErrorFT, getRecommendedActions, getArrayField<&Error::recommendedActions>),
    SLOT(CMPIErrorFT, getErrorSource, getTextField<&Error::source>),
    SLOT(CMPIErrorFT, getErrorSourceFormat, getField<&Error::sourceFormat>),
    SLOT(CMPIErrorFT, getOtherErrorSourceFormat, getTextField<&Error::otherSourceFormat>),
    SLOT(CMPIErrorFT, getCIMStatusCode, getField<&Error::statusCode>),
    SLOT(CMPIErrorFT, getCIMStatusCodeDescription, getTextField<&Error::statusCodeDescription>),
    SLOT(CMPIErrorFT, getMessageArguments, getArrayField<&Error::messageArguments>),
    SLOT(CMPIErrorFT, setErrorType, (setField<&Error::type, CMPIErrorType>)),
    SLOT(CMPIErrorFT, setOtherErrorType, setTextField<&Error::otherType>),
    SLOT(CMPIErrorFT, setProbableCauseDescription, setTextField<&Error::probableCauseDescription>),
    SLOT(CMPIErrorFT, setRecommendedActions, setArrayField<&Error::recommendedActions>),
    SLOT(CMPIErrorFT, setErrorSource, setTextField<&Error::source>),
    SLOT(CMPIErrorFT, setErrorSourceFormat, (setField<&Error::sourceFormat, CMPIErrorSrcFormat>)),
    SLOT(CMPIErrorFT, setOtherErrorSourceFormat, setTextField<&Error::otherSourceFormat>),
    SLOT(CMPIErrorFT, setCIMStatusCodeDescription, setTextField<&Error::statusCodeDescription>),
    SLOT(CMPIErrorFT, setMessageArguments, setArrayField<&Error::messageArguments>),
};

} // namespace oxahv

// The steps that the setters and the getters of array properties share. Nothing here traces.
#pragma once

#include "Accessors.h"

#include <cstddef>
#include <string>
#include <vector>

namespace TK {

// Fills a new array element by element until the broker refuses one, then sets a property to it.
class ArrayFilling {
public:
    // Makes the array, unless it would be empty.
    ArrayFilling(const CMPIBroker* broker, std::size_t size, CMPIType elementType)
        : broker_(broker), size_(static_cast<CMPICount>(size)), elementType_(elementType) {
        if (size_ != 0) {
            CMPIStatus status;
            CMPIArray* const array = cmpi::newArray(broker, size_, elementType, status);
            array_ = cmpi::failed(status) ? nullptr : array;
        }
    }

    // Whether the next element is wanted, and its position.
    bool wantsMore() const { return array_ != nullptr && next_ < size_ && !refused_; }
    CMPICount next() const { return next_; }

    template <class Number>
    void put(Number number) {
        CMPIValue value = {};
        value.*CmpiType<Number>::member = number;
        putValue(value);
    }

    // Null when the broker refuses; putting that ends the filling, as a refused element does.
    CMPIString* newString(const std::string& text) {
        CMPIStatus status;
        CMPIString* const string = cmpi::newString(broker_, text.c_str(), status);
        return cmpi::failed(status) ? nullptr : string;
    }
    void put(CMPIString* string) {
        refused_ = string == nullptr;
        if (!refused_) {
            CMPIValue value = {};
            value.string = string;
            putValue(value);
        }
    }
    void put(const std::string& text) { put(newString(text)); }

    // Sets the property if there is an array, also to one whose filling ended early.
    void finish(CMPIInstance* instance, const char* name) {
        if (array_ != nullptr) {
            CMPIValue value = {};
            value.array = array_;
            cmpi::add(instance, name, &value, static_cast<CMPIType>(elementType_ | CMPI_ARRAY));
        }
    }

private:
    void putValue(CMPIValue& value) {
        refused_ = cmpi::failed(cmpi::setElementAt(array_, next_++, &value, elementType_));
    }

    const CMPIBroker* broker_;
    CMPICount size_;
    CMPIType elementType_;
    CMPIArray* array_ = nullptr;
    CMPICount next_ = 0;
    bool refused_ = false;
};

template <class Element>
void setArray(const CMPIBroker* broker, CMPIInstance* instance, const char* name, CMPIType elementType,
              const std::vector<Element>& elements) {
    ArrayFilling filling(broker, elements.size(), elementType);
    while (filling.wantsMore()) {
        filling.put(elements[filling.next()]);
    }
    filling.finish(instance, name);
}

// Reads an array property's elements one by one; `append` gets each that the broker could read. The data
// alone decides whether there is an array: some brokers report a status with one that can be read.
template <class Append>
bool getArray(const CMPIInstance* instance, const char* name, const Append& append) {
    CMPIStatus status;
    const CMPIData data = cmpi::get(instance, name, status);
    if (cmpi::isNull(data) || (data.type & CMPI_ARRAY) == 0) {
        return false;
    }
    const CMPICount count = cmpi::getCount(data.value.array, status);
    for (CMPICount i = 0; i < count; ++i) {
        const CMPIData element = cmpi::getElementAt(data.value.array, i, status);
        if (!cmpi::failed(status)) {
            append(element.value);
        }
    }
    return true;
}

} // namespace TK

// The broker's objects: what their function tables do.
#include "EmbeddedBroker.h"

#include <ctime>
#include <gtest/gtest.h>
#include <thread>

using oxahv::ClassDeclaration;
using oxahv::EmbeddedBroker;
using oxahv::LiveObjects;
using oxahv::Request;

namespace {

class ObjectsTest : public testing::Test {
protected:
    CMPIString* string(const char* text) { return CMNewString(handle_, text, nullptr); }

    static std::string textOf(const CMPIString* string) { return CMGetCharsPtr(string, nullptr); }

    EmbeddedBroker broker_;
    const CMPIBroker* const handle_ = broker_.handle();
    Request request_{broker_};
    CMPIObjectPath* const path_ = request_.objectPath("root", "Demo");
};

} // namespace

TEST_F(ObjectsTest, RejectForeignHandlesAndNullTexts) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    EXPECT_EQ(CMNewInstance(handle_, reinterpret_cast<CMPIObjectPath*>(string("")), &status), nullptr);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_EQ(CMNewObjectPath(handle_, "root", nullptr, &status), nullptr);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(CMAddKey(path_, nullptr, "v", CMPI_chars).rc, CMPI_RC_ERR_INVALID_PARAMETER);
}

TEST_F(ObjectsTest, KeepKeysInOrderIgnoringCase) {
    char text[] = "first";
    CMPIValue value = {};
    value.uint16 = 7;
    CMAddKey(path_, "B", text, CMPI_chars);
    CMAddKey(path_, "a", &value, CMPI_uint16);
    text[0] = 'X'; // texts are copied
    EXPECT_EQ(oxahv::pathText(path_), "root:Demo.B=\"first\",a=7");
    CMAddKey(path_, "b", "second", CMPI_chars); // and replaced in their place
    EXPECT_EQ(oxahv::pathText(path_), "root:Demo.B=\"second\",a=7");

    CMPIString* name = nullptr;
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPIData key = CMGetKeyAt(path_, 0, &name, nullptr);
    EXPECT_TRUE(key.type == CMPI_string && key.state == CMPI_keyValue);
    EXPECT_EQ(textOf(name), "B");
    CMGetKeyAt(path_, 2, nullptr, &status);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(CMGetKey(path_, "missing", nullptr).state, CMPI_nullValue | CMPI_notFound);

    CMSetHostname(path_, "host");
    CMPIObjectPath* const other = request_.objectPath("", "Other");
    other->ft->setHostAndNameSpaceFromObjectPath(other, CMClone(path_, nullptr));
    EXPECT_EQ(textOf(CMGetHostname(other, nullptr)), "host");
    EXPECT_EQ(oxahv::pathText(other), "root:Other");
}

TEST_F(ObjectsTest, KeepNullValues) {
    CMAddKey(path_, "Key", nullptr, CMPI_uint16);
    const CMPIData key = CMGetKeyAt(path_, 0, nullptr, nullptr);
    EXPECT_TRUE(key.type == CMPI_uint16 && key.state == (CMPI_keyValue | CMPI_nullValue));
    CMPIInstance* const instance = CMNewInstance(handle_, path_, nullptr);
    CMPIValue none = {};
    CMSetProperty(instance, "Number", nullptr, CMPI_uint32);
    CMSetProperty(instance, "Text", nullptr, CMPI_chars);
    CMSetProperty(instance, "String", &none, CMPI_string);
    for (const char* const name : {"Key", "Number", "Text", "String"}) {
        CMPIStatus status = {CMPI_RC_ERR_FAILED, nullptr};
        EXPECT_TRUE(CMIsNullValue(CMGetProperty(instance, name, &status))) << name;
        EXPECT_EQ(status.rc, CMPI_RC_OK) << name;
    }
    EXPECT_EQ(CMGetProperty(instance, "Text", nullptr).type, CMPI_string);
    EXPECT_EQ(oxahv::valueText({CMPI_chars, CMPI_goodValue, {}}), "?");
}

TEST_F(ObjectsTest, ChecksInstancesAgainstTheirClass) {
    broker_.declare(ClassDeclaration("Demo_Base").key("Id", CMPI_uint16).property("Text", CMPI_string));
    broker_.declare(ClassDeclaration("Demo").superclass("demo_base").property("Numbers", CMPI_uint8A));
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    EXPECT_EQ(CMNewInstance(handle_, request_.objectPath("root", "Other"), &status), nullptr);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_CLASS);

    CMPIValue value = {};
    value.uint16 = 7;
    EXPECT_EQ(CMAddKey(path_, "Id", &value, CMPI_uint32).rc, CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(CMAddKey(path_, "Key", &value, CMPI_uint16).rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    EXPECT_EQ(CMAddKey(path_, "Text", "no key", CMPI_chars).rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    EXPECT_EQ(CMAddKey(path_, "id", &value, CMPI_uint16).rc, CMPI_RC_OK);

    CMPIInstance* const instance = CMNewInstance(handle_, path_, nullptr);
    EXPECT_EQ(CMGetPropertyCount(instance, nullptr), 3U);
    EXPECT_EQ(CMGetProperty(instance, "ID", nullptr).value.uint16, 7);
    EXPECT_TRUE(CMIsNullValue(CMGetProperty(instance, "Text", nullptr)));
    EXPECT_EQ(CMSetProperty(instance, "text", "ok", CMPI_chars).rc, CMPI_RC_OK);
    EXPECT_EQ(CMSetProperty(instance, "Text", &value, CMPI_uint16).rc, CMPI_RC_ERR_TYPE_MISMATCH);
    EXPECT_EQ(CMSetProperty(instance, "Nothing", &value, CMPI_uint16).rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    EXPECT_EQ(CMGetProperty(instance, "missing", &status).state, CMPI_nullValue | CMPI_notFound);
    EXPECT_EQ(status.rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    EXPECT_NE(CMClassPathIsA(handle_, path_, "DEMO_BASE", nullptr), 0);
    EXPECT_EQ(CMClassPathIsA(handle_, request_.objectPath("root", "Demo_Base"), "Demo", nullptr), 0);
}

TEST_F(ObjectsTest, FilterDropsOtherProperties) {
    CMAddKey(path_, "Id", "x", CMPI_chars);
    CMPIInstance* instance = CMNewInstance(handle_, path_, nullptr);
    const auto set = [&](std::initializer_list<const char*> names) {
        for (const char* const name : names) {
            EXPECT_EQ(CMSetProperty(instance, name, "y", CMPI_chars).rc, CMPI_RC_OK);
        }
        return CMGetPropertyCount(instance, nullptr);
    };
    set({"Before"});
    const char* wanted[] = {"wanted", nullptr};
    CMSetPropertyFilter(instance, wanted, nullptr);
    instance = CMClone(instance, nullptr);
    EXPECT_EQ(set({"Wanted", "Other", "Id"}), 2U);
    EXPECT_EQ(oxahv::pathText(CMGetObjectPath(instance, nullptr)), "root:Demo.Id=\"y\"");
    const char* keys[] = {"NewKey", nullptr};
    CMSetPropertyFilter(instance, wanted, keys);
    EXPECT_EQ(set({"newkey"}), 3U);
    EXPECT_EQ(instance->ft->setObjectPath(instance, path_).rc, CMPI_RC_OK);
    EXPECT_EQ(oxahv::pathText(CMGetObjectPath(instance, nullptr)), "root:Demo.Id=\"x\"");
}

TEST_F(ObjectsTest, ArraysHoldNullElements) {
    CMPIValue value = {};
    value.real32 = 1.5F;
    CMPIValue whole = {};
    whole.array = CMNewArray(handle_, 2, CMPI_real32, nullptr);
    EXPECT_EQ(CMSetArrayElementAt(whole.array, 1, &value, CMPI_real32).rc, CMPI_RC_OK);
    EXPECT_EQ(CMSetArrayElementAt(whole.array, 2, &value, CMPI_real32).rc, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(CMSetArrayElementAt(whole.array, 0, &value, CMPI_real64).rc, CMPI_RC_ERR_TYPE_MISMATCH);
    broker_.declare(ClassDeclaration("Demo")
                        .property("Reals", CMPI_real32A)
                        .property("Texts", CMPI_stringA)
                        .property("Numbers", CMPI_uint16A));
    CMPIInstance* const instance = CMNewInstance(handle_, path_, nullptr);
    CMSetProperty(instance, "Reals", &whole, CMPI_real32A);
    EXPECT_EQ(oxahv::valueText(CMGetProperty(instance, "Reals", nullptr)), "{NULL, 1.5}");
    EXPECT_EQ(CMSetProperty(instance, "Numbers", &whole, CMPI_uint16A).rc, CMPI_RC_ERR_TYPE_MISMATCH)
        << "the array's own type counts";
    whole.array = CMNewArray(handle_, 1, CMPI_chars, nullptr);
    EXPECT_EQ(CMSetArrayElementAt(whole.array, 0, "chars", CMPI_chars).rc, CMPI_RC_OK);
    EXPECT_EQ(CMSetProperty(instance, "Texts", &whole, CMPI_charsA).rc, CMPI_RC_OK);
    EXPECT_EQ(oxahv::valueText(CMGetProperty(instance, "Texts", nullptr)), "{\"chars\"}");
    EXPECT_EQ(CMSetProperty(instance, "Texts", nullptr, CMPI_charsA).rc, CMPI_RC_OK);
    EXPECT_EQ(CMGetProperty(instance, "Texts", nullptr).type, CMPI_stringA);
    EXPECT_EQ(CMNewArray(handle_, 1, CMPI_uint8A, nullptr), nullptr);
}

TEST_F(ObjectsTest, ConvertsDatesAndIntervals) {
    struct {
        const char* text;
        bool isInterval;
        CMPIUint64 binary;
        const char* back; // from the binary form
    } const rows[] = {
        {"20240301013000.000000+090", false, 1709251200000000, "20240301000000.000000+000"},
        {"20240229190000.000000-300", false, 1709251200000000, "20240301000000.000000+000"},
        {"99991231235959.999999+000", false, 253402300799999999, "99991231235959.999999+000"},
        {"2000022912****.******+000", false, 951825600000000, "20000229120000.000000+000"},
        {"19691231235959.999999+000", false, 0, "19700101000000.000000+000"}, // none before 1970
        {"20240301******.******+000", false, 1709251200000000, "20240301000000.000000+000"},
        {"20240301000000.12****+000", false, 1709251200120000, "20240301000000.120000+000"},
        {"00000001020304.000005:000", true, 93784000005, "00000001020304.000005:000"},
        {"99999999235959.999999:000", true, 8639999999999999999ULL, "99999999235959.999999:000"},
        {"00000002******.******:000", true, 172800000000, "00000002000000.000000:000"},
    };
    for (const auto& row : rows) {
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        CMPIDateTime* const dateTime = CMNewDateTimeFromChars(handle_, row.text, &status);
        ASSERT_NE(dateTime, nullptr) << row.text;
        EXPECT_EQ(textOf(CMGetStringFormat(dateTime, nullptr)), row.text);
        EXPECT_EQ(CMIsInterval(dateTime, nullptr) != 0, row.isInterval) << row.text;
        EXPECT_EQ(CMGetBinaryFormat(dateTime, nullptr), row.binary) << row.text;
        CMPIDateTime* const back =
            CMNewDateTimeFromBinary(handle_, row.binary, row.isInterval ? 1 : 0, nullptr);
        EXPECT_EQ(textOf(CMGetStringFormat(back, nullptr)), row.back) << row.text;
    }
    for (const char* const text : {"20241301000000.000000+000",  "20240132000000.000000+000",
                                   "20240101240000.000000+000",  "20230229000000.000000+000",
                                   "19000229000000.000000+000",  "20240431000000.000000+000",
                                   "20240001000000.000000+000",  "20240100000000.000000+000",
                                   "*0240101000000.000000+000",  "20240101000060.000000+000",
                                   "20240101000000:000000+000",  "20240101000000.000000 000",
                                   "20240101000000.000000+0x0",  "2024**01000000.000000+000",
                                   "20240101000000.1*2***+000",  "00000001020304.000005:001",
                                   "00000001240000.000000:000",  "20240101000000.00000+0000",
                                   "20240101000000.000000+0000", ""}) {
        CMPIStatus status = {CMPI_RC_OK, nullptr};
        EXPECT_EQ(CMNewDateTimeFromChars(handle_, text, &status), nullptr) << text;
        EXPECT_EQ(status.rc, CMPI_RC_ERR_INVALID_PARAMETER) << text;
    }
    EXPECT_EQ(CMNewDateTimeFromBinary(handle_, ~0ULL, 0, nullptr), nullptr);
    // Every day of four centuries comes back.
    for (std::time_t day = 0; day < 146097; ++day) {
        const std::time_t seconds = day * 86400;
        std::tm time{};
        char text[32];
        std::strftime(text, sizeof text, "%Y%m%d%H%M%S.000000+000", gmtime_r(&seconds, &time));
        const auto binary = static_cast<CMPIUint64>(seconds) * 1000000;
        CMPIDateTime* const dateTime = CMNewDateTimeFromBinary(handle_, binary, 0, nullptr);
        ASSERT_EQ(textOf(CMGetStringFormat(dateTime, nullptr)), text);
        ASSERT_EQ(CMGetBinaryFormat(dateTime, nullptr), binary);
        CMRelease(dateTime);
    }
}

TEST_F(ObjectsTest, RequestFreesItsObjects) {
    const LiveObjects before = broker_.liveObjects();
    CMPIInstance* clone = nullptr;
    {
        const Request inner(broker_);
        CMPIInstance* const instance = CMNewInstance(handle_, path_, nullptr);
        CMSetProperty(instance, "Key", "text", CMPI_chars);
        clone = CMClone(instance, nullptr);
        EXPECT_GT(broker_.liveObjects().total(), before.total() + 4);
    }
    EXPECT_EQ(broker_.liveObjects().instances, before.instances + 1);
    EXPECT_EQ(CMRelease(CMGetProperty(clone, "Key", nullptr).value.string).rc, CMPI_RC_OK);
    EXPECT_EQ(textOf(CMGetProperty(clone, "Key", nullptr).value.string), "text")
        << "a part stays its whole's";
    EXPECT_EQ(CMRelease(clone).rc, CMPI_RC_OK);
    EXPECT_EQ(broker_.liveObjects().instances, before.instances);

    std::thread([&] { // has no request: what it makes is the broker's
        CMPIGcStat* const mark = handle_->mft->mark(handle_, nullptr);
        const LiveObjects marked = broker_.liveObjects();
        CMPIString* const copy = CMClone(string("text"), nullptr);
        CMNewArgs(handle_, nullptr);
        EXPECT_EQ(handle_->mft->release(handle_, mark).rc, CMPI_RC_OK);
        EXPECT_EQ(broker_.liveObjects().total(), marked.total()) << "the clone is there, the mark is gone";
        EXPECT_EQ(broker_.liveObjects().strings, marked.strings + 1);
        EXPECT_EQ(CMRelease(copy).rc, CMPI_RC_OK);
    })
        .join();
    EXPECT_EQ(CMRelease(const_cast<CMPIContext*>(request_.context())).rc, CMPI_RC_OK);
    EXPECT_NE(CMGetContextEntryCount(request_.context(), nullptr), 0U) << "a request's context stays its own";
}

TEST_F(ObjectsTest, DescribesObjectsAndFormatsMessages) {
    EXPECT_EQ(textOf(handle_->eft->getType(handle_, path_, nullptr)), "CMPIObjectPath");
    EXPECT_NE(handle_->eft->isOfType(handle_, string("x"), "CMPIString", nullptr), 0);
    EXPECT_EQ(textOf(handle_->eft->toString(handle_, path_, nullptr)), "root:Demo");
    CMPIString* const message =
        handle_->eft->getMessage(handle_, "id", "{0} of {1}: {2} {0} {4} {0 { {3}", nullptr, 4, CMPI_chars,
                                 "{1}", CMPI_uint32, 7U, CMPI_string, string("down"), CMPI_real64, 0.1);
    EXPECT_EQ(textOf(message), "{1} of 7: down {1} {4} {0 { 0.1");
    const CMPIError* const error = handle_->eft->newCMPIError(
        handle_, "owner", "id", "message", ErrorSevHigh, ErrorProbCauseOther, CMPI_RC_ERR_FAILED, nullptr);
    error->ft->setErrorSource(error, "source");
    EXPECT_EQ(textOf(error->ft->getErrorSource(error, nullptr)), "source");
    EXPECT_EQ(error->ft->getPerceivedSeverity(error, nullptr), ErrorSevHigh);
    const char* names[] = {"One", "Two", nullptr};
    const CMPIPropertyList* const list = handle_->eft->newPropertyList(handle_, names, nullptr);
    EXPECT_NE(list->ft->isPropertyInList(list, "two", nullptr), 0);
    EXPECT_STREQ(list->ft->getProperties(list, nullptr)[0], "One");

    std::vector<std::string> seen;
    broker_.setMessageHandler(
        [&](const oxahv::BrokerMessage& m) { seen.push_back(m.component + '|' + m.text); });
    handle_->eft->logMessage(handle_, CMPI_SEV_ERROR, "id", nullptr, string("text"));
    handle_->eft->trace(handle_, CMPI_LEV_INFO, "component", "trace", nullptr);
    EXPECT_EQ(seen, std::vector<std::string>({"id|text", "component|trace"}));
    broker_.setMessageHandler([](const oxahv::BrokerMessage&) { throw 1; });
    EXPECT_EQ(handle_->eft->trace(handle_, CMPI_LEV_INFO, nullptr, "trace", nullptr).rc, CMPI_RC_ERR_FAILED);
}

TEST_F(ObjectsTest, OffersThreadsAndMemory) {
    const CMPIBrokerExtFT* const x = handle_->xft;
    struct Shared {
        const CMPIBrokerExtFT* x;
        CMPI_MUTEX_TYPE mutex;
        CMPI_COND_TYPE condition;
        bool isSet;
    } shared = {x, x->newMutex(0), x->newCondition(0), false};
    const auto set = [](void* parameter) -> void* {
        auto* const mine = static_cast<Shared*>(parameter);
        mine->x->lockMutex(mine->mutex);
        mine->isSet = true;
        mine->x->signalCondition(mine->condition);
        mine->x->unlockMutex(mine->mutex);
        return parameter;
    };
    CMPI_THREAD_TYPE const thread = x->newThread(set, &shared, 0);
    x->lockMutex(shared.mutex);
    while (!shared.isSet) {
        EXPECT_EQ(x->condWait(shared.condition, shared.mutex), 0);
    }
    x->unlockMutex(shared.mutex);
    CMPI_THREAD_RETURN result = nullptr;
    EXPECT_EQ(x->joinThread(thread, &result), 0);
    EXPECT_EQ(result, &shared);
    EXPECT_EQ(x->destroyCondition2(shared.condition) + x->destroyMutex2(shared.mutex), 0);
    EXPECT_NE(x->lockMutex2(nullptr), 0);

    char* const text = handle_->mft->cmpiStrDup(handle_, "text");
    EXPECT_STREQ(text, "text");
    handle_->mft->cmpiFree(handle_, text);
}

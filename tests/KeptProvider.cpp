// A provider that keeps the instances that clients make, of the classes in mof/Kept.mof.
#include "ProviderKit.h"

#include <fstream>
#include <map>
#include <mutex>
#include <string>
#include <vector>

namespace {

void require(bool succeeded) {
    if (!succeeded) {
        throw oxahv::Refusal(CMPI_RC_ERR_FAILED, "the broker failed");
    }
}

// Calls `take` with the name and value of each property.
template <class Take>
void eachProperty(const CMPIInstance* instance, const Take& take) {
    CMPIStatus status = {CMPI_RC_OK, nullptr};
    const CMPICount count = CMGetPropertyCount(instance, &status);
    for (CMPICount i = 0; status.rc == CMPI_RC_OK && i < count; ++i) {
        CMPIString* name = nullptr;
        const CMPIData data = CMGetPropertyAt(instance, i, &name, &status);
        const char* const chars = name != nullptr ? CMGetCharsPtr(name, nullptr) : nullptr;
        require(status.rc == CMPI_RC_OK && chars != nullptr);
        take(chars, data);
    }
    require(status.rc == CMPI_RC_OK);
}

class KeptProvider : public oxahv::InstanceProvider,
                     public oxahv::AssociationProvider,
                     public oxahv::MethodProvider {
public:
    // The context may name a file that is made when the provider ends.
    explicit KeptProvider(const oxahv::Context& context)
        : endFile_(context.get<std::optional<std::string>>("KeptEndFile").value_or("")) {
        serve("Kept_Thing", &KeptProvider::things);
        serve("Kept_Special", &KeptProvider::things);
        serve("Kept_Link", &KeptProvider::links);
        method("Exchange", &KeptProvider::exchange,
               {"Flag", "Letter", "Number", "Long", "Real", "Text", "Texts", "When", "Peer"});
        method("Refuse", &KeptProvider::refuse);
    }
    ~KeptProvider() override {
        for (const auto& [id, thing] : things_) {
            CMRelease(thing.instance);
        }
        if (!endFile_.empty()) {
            std::ofstream(endFile_) << "ended";
        }
    }
    KeptProvider(const KeptProvider&) = delete;
    KeptProvider& operator=(const KeptProvider&) = delete;

    oxahv::Path create(const oxahv::Operation& operation, const oxahv::Instance& wanted) override {
        const std::lock_guard<std::mutex> lock(mutex_);
        const auto id = wanted.get<std::string>("Id");
        if (things_.count(id) != 0) {
            throw oxahv::Refusal(CMPI_RC_ERR_ALREADY_EXISTS, "there is a thing " + id);
        }
        CMPIInstance* const kept = CMClone(wanted.handle(), nullptr);
        require(kept != nullptr);
        things_[id] = {operation.className(), kept};
        return operation.path(operation.className(), {{"Id", id}});
    }

    void modify(const oxahv::Operation& operation, const oxahv::Instance& wanted) override {
        const std::lock_guard<std::mutex> lock(mutex_);
        CMPIInstance* const kept = found(operation)->second.instance;
        eachProperty(wanted.handle(), [&](const char* name, const CMPIData& data) {
            if (operation.wants(name)) {
                const CMPIValue* const value = CMIsNullValue(data) ? nullptr : &data.value;
                require(CMSetProperty(kept, name, value, data.type).rc == CMPI_RC_OK);
            }
        });
    }

    void remove(const oxahv::Operation& operation) override {
        const std::lock_guard<std::mutex> lock(mutex_);
        const auto thing = found(operation);
        CMRelease(thing->second.instance);
        things_.erase(thing);
    }

    void associations(const oxahv::Operation& operation, oxahv::Instances& reply) override {
        links(operation, reply);
    }

private:
    struct Thing {
        std::string className;
        CMPIInstance* instance; // a clone, which is the provider's own
    };
    using Things = std::map<std::string, Thing>;

    Things::iterator found(const oxahv::Operation& operation) {
        const auto thing = things_.find(operation.key<std::string>("Id"));
        if (thing == things_.end()) {
            throw oxahv::Refusal(CMPI_RC_ERR_NOT_FOUND, "there is no such thing");
        }
        return thing;
    }

    void things(const oxahv::Operation& operation, oxahv::Instances& reply) {
        const std::lock_guard<std::mutex> lock(mutex_);
        for (const auto& [id, thing] : things_) {
            // As some providers do, this one returns those of the subclass for the class too.
            if (!operation.isFor(thing.className.c_str()) && !operation.isFor("Kept_Thing")) {
                continue;
            }
            oxahv::Instance instance = operation.instance(thing.className.c_str(), {{"Id", id}});
            eachProperty(thing.instance,
                         [&](const char* name, const CMPIData& data) { instance.set(name, data); });
            reply.add(instance);
        }
    }

    // Without the lock: the reply may ask this provider for the things at the ends.
    void links(const oxahv::Operation& operation, oxahv::Instances& reply) {
        const Things things = [&] {
            const std::lock_guard<std::mutex> lock(mutex_);
            return things_;
        }();
        const std::pair<const std::string, Thing>* earlier = nullptr;
        const auto path = [&](const auto& thing) {
            return operation.path(thing.second.className.c_str(), {{"Id", thing.first}});
        };
        for (const auto& thing : things) {
            if (earlier != nullptr) {
                reply.add(
                    operation.instance("Kept_Link", {{"Earlier", path(*earlier)}, {"Later", path(thing)}}));
            }
            earlier = &thing;
        }
    }

    std::uint32_t exchange(bool& flag, char16_t& /*letter*/, std::uint8_t& number,
                           std::int64_t& /*longNumber*/, double& /*real*/, std::string& /*text*/,
                           std::vector<std::string>& /*texts*/, std::optional<TK::DateTime>& /*when*/,
                           std::optional<oxahv::Path>& /*peer*/) {
        flag = !flag;
        return number;
    }

    // The principal is who asks.
    std::string refuse(const oxahv::Operation& operation) {
        const auto principal = operation.context().get<std::optional<std::string>>("CMPIPrincipal");
        throw oxahv::Refusal(CMPI_RC_ERR_ACCESS_DENIED, "nöt <this>" + principal.value_or(""));
    }

    const std::string endFile_;
    std::mutex mutex_;
    Things things_;
};

} // namespace

OXAHV_PROVIDER(KeptProvider, KeptProvider);

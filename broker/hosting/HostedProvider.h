// One provider: its library, its factories, its MIs and their end. Which requests it gets, Hosting decides.
#pragma once

#include "objects/Object.h"

#include <future>
#include <string>
#include <string_view>
#include <tuple>
#include <vector>

namespace oxahv {

class Classes;

// It dies with its last user, which may be a request that is inside it.
class HostedProvider {
public:
    HostedProvider(Core& core, std::string name, std::vector<std::string> classes)
        : core_(core), name_(std::move(name)), classes_(std::move(classes)) {}
    ~HostedProvider();
    HostedProvider(const HostedProvider&) = delete;
    HostedProvider& operator=(const HostedProvider&) = delete;

    const std::string& name() const { return name_; }
    std::future<void> gone() { return gone_.get_future(); }

    // Makes the MIs; throws BrokerError when a factory fails, or when there is none.
    void create(const ProviderFactories& factories);
    // Loads the provider's library, which is unloaded with this object, and makes the MIs by its factories.
    void load(const std::string& file);

    bool serves(const Classes& declared, std::string_view className) const;
    bool servesAll() const { return classes_.empty(); }
    // Whether it serves a class that derives from this one.
    bool servesPartOf(const Classes& declared, std::string_view className) const;
    // Whether instances of the class may be ends of associations that it serves, as far as they are declared.
    bool mayAssociate(const Classes& declared, std::string_view className) const;

    // Null where the provider has no such MI.
    template <class MI>
    MI* mi() const {
        return std::get<MI*>(mis_);
    }

private:
    template <class Make>
    void createEach(const Make& make);
    template <class MI>
    MI* createFromLibrary() const;
    template <class MI, class Factory>
    MI* made(const Factory& factory) const;
    void cleanUp();

    Core& core_;
    std::string name_;
    std::vector<std::string> classes_;
    void* library_ = nullptr;
    std::tuple<CMPIInstanceMI*, CMPIAssociationMI*, CMPIMethodMI*, CMPIPropertyMI*, CMPIIndicationMI*> mis_{};
    std::promise<void> gone_;
};

} // namespace oxahv

// SPDX-License-Identifier: Apache-2.0
#include "StorageReply.h"

#include <limits>
#include <optional>
#include <string>
#include <utility>

namespace Lumod {

namespace {

constexpr uint32_t notTold = std::numeric_limits<uint32_t>::max();
/// What an element takes besides its texts, about.
constexpr std::size_t arrayBytes = 80;
constexpr std::size_t endpointBytes = 80;
constexpr std::size_t containerBytes = 80;

kj::StringPtr textOf(std::string const &text) {
    return {text.c_str(), text.size()};
}

std::size_t sizeOf(std::optional<std::string> const &text) {
    return text ? text->size() + 8 : 0;
}

std::size_t sizeOf(Orka::StorageArray const &array) {
    std::size_t bytes = arrayBytes + array.id.size() + array.name.size() + array.vendorId.size() + array.modelId.size();
    for (Orka::Endpoint const &endpoint : array.endpoints) {
        bytes += endpointBytes + sizeOf(endpoint.uid) + sizeOf(endpoint.text1) + sizeOf(endpoint.text2);
        for (std::string const &address : endpoint.nfs4xAddresses) {
            bytes += address.size() + 16;
        }
    }
    return bytes;
}

class StorageReply : public ReplySource {
public:
    StorageReply(std::shared_ptr<View const> view, std::vector<uint32_t> containers, Outages::Uids outages)
        : view_(std::move(view))
        , containers_(std::move(containers))
        , outages_(std::move(outages))
        , tablePlaces_(view_->arrays().size(), notTold) {
        for (uint32_t const container : containers_) {
            for (uint32_t const array : view_->containers()[container].arrays) {
                if (tablePlaces_[array] == notTold) {
                    tablePlaces_[array] = static_cast<uint32_t>(table_.size());
                    table_.push_back(view_->arrays()[array].facts);
                }
            }
        }
    }

    bool next(Wire::Reply::Builder reply) override {
        if (arraysTold_ < table_.size()) {
            arraysTold_ = fillChunk(
                arraysTold_, table_.size(), [this](std::size_t at) { return sizeOf(*table_[at]); },
                [&reply](unsigned size) { return reply.initStorageArrays(size); },
                [this](auto &list, unsigned place, std::size_t at) { fillArray(list[place], *table_[at]); });
            return true; // the containers follow
        }
        containersTold_ = fillChunk(
            containersTold_, containers_.size(), [this](std::size_t at) { return sizeOfContainer(at); },
            [&reply](unsigned size) { return reply.initStorageContainers(size); },
            [this](auto &list, unsigned place, std::size_t at) { fillContainer(list[place], at); });
        return containersTold_ < containers_.size();
    }

    std::size_t nextBytes() const override {
        std::size_t bytes = 0;
        if (arraysTold_ < table_.size()) {
            endOfChunk(
                arraysTold_, table_.size(), [this](std::size_t at) { return sizeOf(*table_[at]); }, bytes);
        } else {
            endOfChunk(
                containersTold_, containers_.size(), [this](std::size_t at) { return sizeOfContainer(at); }, bytes);
        }
        return bytes;
    }

private:
    ServedContainer const &container(std::size_t at) const {
        return view_->containers()[containers_[at]];
    }

    std::size_t sizeOfContainer(std::size_t at) const {
        ServedContainer const &entry = container(at);
        return containerBytes + entry.facts->id.size() + entry.facts->name.size() + entry.provider->record.url.size() +
               4 * entry.arrays.size();
    }

    void fillContainer(Wire::StorageContainer::Builder builder, std::size_t at) const {
        ServedContainer const &entry = container(at);
        builder.setId(textOf(entry.facts->id));
        builder.setName(textOf(entry.facts->name));
        builder.setProviderUrl(textOf(entry.provider->record.url));
        builder.setMaxLumoSizeMb(entry.facts->maxLumoSizeMb);
        auto places = builder.initArrays(static_cast<unsigned>(entry.arrays.size()));
        for (unsigned place = 0; place < places.size(); ++place) {
            places.set(place, tablePlaces_[entry.arrays[place]]);
        }
    }

    void fillArray(Wire::StorageArray::Builder builder, Orka::StorageArray const &array) const {
        builder.setId(textOf(array.id));
        builder.setName(textOf(array.name));
        builder.setVendorId(textOf(array.vendorId));
        builder.setModelId(textOf(array.modelId));
        auto endpoints = builder.initEndpoints(static_cast<unsigned>(array.endpoints.size()));
        for (unsigned place = 0; place < endpoints.size(); ++place) {
            fillEndpoint(endpoints[place], array.endpoints[place]);
        }
    }

    void fillEndpoint(Wire::Endpoint::Builder builder, Orka::Endpoint const &endpoint) const {
        if (endpoint.uid) {
            builder.setUid(textOf(*endpoint.uid));
        }
        builder.setType(endpoint.type);
        if (endpoint.text1) {
            builder.setText1(textOf(*endpoint.text1));
        }
        if (endpoint.text2) {
            builder.setText2(textOf(*endpoint.text2));
        }
        auto addresses = builder.initAddresses(static_cast<unsigned>(endpoint.nfs4xAddresses.size()));
        for (unsigned place = 0; place < addresses.size(); ++place) {
            addresses.set(place, textOf(endpoint.nfs4xAddresses[place]));
        }
        bool const isOut = endpoint.uid && outages_.find(*endpoint.uid) != outages_.end();
        builder.setIsAccessible(endpoint.isAccessible && !isOut);
        builder.setIsConfigured(endpoint.isConfigured);
    }

    std::shared_ptr<View const> view_;
    std::vector<uint32_t> containers_;
    Outages::Uids outages_;
    std::vector<uint32_t> tablePlaces_; ///< for each array of the view its place in the reply's table
    std::vector<Orka::StorageArray const *> table_;
    std::size_t arraysTold_ = 0;
    std::size_t containersTold_ = 0;
};

} // namespace

ReplyPtr storageReply(std::shared_ptr<View const> view, std::vector<uint32_t> containers, Outages::Uids outages) {
    return std::make_unique<StorageReply>(std::move(view), std::move(containers), std::move(outages));
}

} // namespace Lumod

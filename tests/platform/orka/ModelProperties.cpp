// SPDX-License-Identifier: Apache-2.0
//
// Random sequences of mutations, performed on an array file and on a model that is nothing but a map in memory. Both
// must answer alike at every step, and hold the same at the end and after reopening.
#include "Fixture.h"

#include <algorithm>
#include <filesystem>
#include <map>

#include <rapidcheck.h>

using namespace Orka;

namespace {

/// What an operation came to: a code, and the id that creation gave.
struct Result {
    Wire::ErrorCode code = Wire::ErrorCode::Success;
    std::string uuid;

    bool operator==(Result const &) const = default;
};

std::ostream &operator<<(std::ostream &stream, Result const &result) {
    return stream << static_cast<int32_t>(result.code) << ' ' << result.uuid;
}

struct Step {
    enum Kind { Create, Delete, Bind, Unbind } kind;
    int name;     ///< Create: which directory name
    int sizeMb;   ///< Create
    int volume;   ///< which of the volumes that were ever created; one too many: none
    int endpoint; ///< Bind: place in `endpoints`
    int key;      ///< 0: none
};

std::ostream &operator<<(std::ostream &stream, Step const &step) {
    constexpr char const *names[] = {"create", "delete", "bind", "unbind"};
    return stream << names[step.kind] << "(name " << step.name << ", size " << step.sizeMb << ", volume " << step.volume
                  << ", endpoint " << step.endpoint << ", key " << step.key << ')';
}

constexpr int64_t silverMaximum = 100;
// Two of the container's, one that is down, one of another container's array, one that is nowhere.
std::vector<std::string> const endpoints{"pe-1", "pe-2", "pe-down", "pe-4", "pe-none"};

class Model {
public:
    Result create(Step const &step, std::string const &nextUuid) {
        auto const name = nameOf(step);
        if (step.sizeMb < 0) {
            return {Wire::ErrorCode::InvalidArgument, ""};
        }
        if (step.sizeMb > silverMaximum) {
            return {Wire::ErrorCode::TooLarge, ""};
        }
        for (auto const &[uuid, volume] : volumes_) {
            if (volume.name == name) {
                return {Wire::ErrorCode::AlreadyExists, ""};
            }
        }
        volumes_[nextUuid] = {name, step.sizeMb == 0 ? silverMaximum : step.sizeMb, ""};
        return {Wire::ErrorCode::Success, nextUuid};
    }
    Result remove(std::string const &uuid) {
        auto const found = volumes_.find(uuid);
        if (found == volumes_.end()) {
            return {Wire::ErrorCode::NoSuchVolume, ""};
        }
        if (!found->second.boundTo.empty()) {
            return {Wire::ErrorCode::InUse, ""};
        }
        volumes_.erase(found);
        return {};
    }
    Result bind(std::string const &uuid, std::string const &endpoint) {
        auto const found = volumes_.find(uuid);
        if (found == volumes_.end()) {
            return {Wire::ErrorCode::NoSuchVolume, ""};
        }
        if (endpoint == "pe-4" || endpoint == "pe-none") {
            return {Wire::ErrorCode::NoSuchEndpoint, ""};
        }
        if (!found->second.boundTo.empty()) {
            return {found->second.boundTo == endpoint ? Wire::ErrorCode::Success : Wire::ErrorCode::InUse, ""};
        }
        if (endpoint == "pe-down") {
            return {Wire::ErrorCode::NoAccessibleEndpoint, ""};
        }
        found->second.boundTo = endpoint;
        return {};
    }
    Result unbind(std::string const &uuid) {
        auto const found = volumes_.find(uuid);
        if (found == volumes_.end()) {
            return {Wire::ErrorCode::NoSuchVolume, ""};
        }
        found->second.boundTo.clear();
        return {};
    }

    void requireSame(ArrayFile &file) const {
        auto const listed = file.configVolumes(silverId, 1000);
        RC_ASSERT(listed.size() == volumes_.size());
        for (auto const &[uuid, volume] : volumes_) {
            auto const found = file.volume(silverId, uuid);
            RC_ASSERT(found.directoryName == volume.name);
            RC_ASSERT(found.sizeMb == volume.sizeMb);
            RC_ASSERT(found.boundTo.value_or("") == volume.boundTo);
            RC_ASSERT(file.volumeByDirectoryName(silverId, volume.name)->uuid == uuid);
            RC_ASSERT(file.metadata(silverId, uuid) == (Metadata{{"directoryName", volume.name}}));
        }
        RC_ASSERT(file.counts().metadataPairs == static_cast<int64_t>(volumes_.size()));
        auto const bound = std::count_if(volumes_.begin(), volumes_.end(),
                                         [](auto const &entry) { return !entry.second.boundTo.empty(); });
        RC_ASSERT(file.boundVolumes().size() == static_cast<size_t>(bound));
    }

    static std::string nameOf(Step const &step) {
        return "vm-" + std::to_string(step.name);
    }

private:
    struct Volume {
        std::string name;
        int64_t sizeMb = 0;
        std::string boundTo;
    };
    std::map<std::string, Volume> volumes_;
};

/// Both sides of one sequence, and the ids that it has met.
class Sequence {
public:
    explicit Sequence(std::string const &path)
        : file_(path, std::chrono::seconds(5), [this] { return nextUuid_; }) {}

    void perform(Step const &step) {
        auto const uuid = static_cast<size_t>(step.volume) < uuids_.size() ? uuids_[static_cast<size_t>(step.volume)]
                                                                           : std::string(noVolume);
        nextUuid_ = countingUuid_();
        auto const onFile = performOnFile(step, uuid);
        auto const onModel = performOnModel(step, uuid);
        RC_ASSERT(onFile == onModel);
        if (step.kind == Step::Create && onFile.code == Wire::ErrorCode::Success &&
            std::find(uuids_.begin(), uuids_.end(), onFile.uuid) == uuids_.end()) {
            uuids_.push_back(onFile.uuid);
        }
    }
    void compare(std::string const &path) {
        model_.requireSame(file_);
        ArrayFile reopened(path);
        model_.requireSame(reopened);
        reopened.checkIntegrity();
    }

private:
    static std::string keyOf(Step const &step) {
        return step.key == 0 ? "" : "key-" + std::to_string(step.key);
    }

    Result performOnFile(Step const &step, std::string const &uuid) {
        Result result;
        result.code = codeOf([&] {
            switch (step.kind) {
            case Step::Create: {
                VolumeSpec spec;
                spec.containerId = silverId;
                spec.directoryName = Model::nameOf(step);
                spec.sizeMb = step.sizeMb;
                result.uuid = file_.createVolume(keyOf(step), spec).uuid;
                break;
            }
            case Step::Delete:
                file_.deleteVolume(keyOf(step), silverId, uuid);
                break;
            case Step::Bind:
                file_.bindVolume(keyOf(step), silverId, uuid, endpoints[static_cast<size_t>(step.endpoint)]);
                break;
            case Step::Unbind:
                file_.unbindVolume(keyOf(step), silverId, uuid);
                break;
            }
        });
        return result;
    }

    Result performOnModel(Step const &step, std::string const &uuid) {
        auto const request = requestOf(step, uuid);
        if (step.key != 0) {
            if (auto const before = answers_.find(step.key); before != answers_.end()) {
                return before->second.first == request ? before->second.second
                                                       : Result{Wire::ErrorCode::InvalidArgument, ""};
            }
        }
        auto const result = step.kind == Step::Create   ? model_.create(step, nextUuid_)
                            : step.kind == Step::Delete ? model_.remove(uuid)
                            : step.kind == Step::Bind ? model_.bind(uuid, endpoints[static_cast<size_t>(step.endpoint)])
                                                      : model_.unbind(uuid);
        if (step.key != 0 && result.code == Wire::ErrorCode::Success) {
            answers_.emplace(step.key, std::pair(request, result));
        }
        return result;
    }

    /// What of a step belongs to the request: two steps with the same are repetitions of each other.
    static std::string requestOf(Step const &step, std::string const &uuid) {
        auto const kind = std::to_string(step.kind);
        if (step.kind == Step::Create) {
            return kind + '/' + std::to_string(step.name) + '/' + std::to_string(step.sizeMb);
        }
        return kind + '/' + uuid + (step.kind == Step::Bind ? '/' + std::to_string(step.endpoint) : "");
    }

    std::function<std::string()> countingUuid_ = countingUuids();
    std::string nextUuid_;
    std::vector<std::string> uuids_;
    std::map<int, std::pair<std::string, Result>> answers_;
    Model model_;
    ArrayFile file_;
};

/// Silver with an endpoint of every sort, and a container that has other arrays.
constexpr char const *topology = R"({"arrays": [
    {"id": "a", "endpoints": [{"uid": "pe-1", "type": "SCSI"}, {"uid": "pe-2", "type": "NFS"},
                              {"uid": "pe-down", "type": "SCSI", "accessible": false}]},
    {"id": "b", "endpoints": [{"uid": "pe-4", "type": "SCSI"}]}],
  "containers": [
    {"id": "00000000-0000-4000-8000-00000000000b", "name": "silver", "maxLumoSizeMb": 100, "arrays": ["a"]},
    {"id": "00000000-0000-4000-8000-00000000000a", "name": "gold", "maxLumoSizeMb": 100, "arrays": ["b"]}]})";

} // namespace

namespace rc {

template <>
struct Arbitrary<Step> {
    static Gen<Step> arbitrary() {
        return gen::build<Step>(
            gen::set(&Step::kind, gen::weightedElement<Step::Kind>(
                                      {{4, Step::Create}, {2, Step::Delete}, {3, Step::Bind}, {2, Step::Unbind}})),
            gen::set(&Step::name, gen::inRange(0, 5)),
            gen::set(&Step::sizeMb, gen::weightedElement<int>({{4, 0}, {4, 7}, {2, 100}, {1, 101}, {1, -1}})),
            gen::set(&Step::volume, gen::inRange(0, 5)), gen::set(&Step::endpoint, gen::inRange(0, 5)),
            gen::set(&Step::key, gen::weightedElement<int>({{6, 0}, {1, 1}, {1, 2}, {1, 3}})));
    }
};

} // namespace rc

class ArrayFileProperties : public OrkaTest {};

TEST_F(ArrayFileProperties, anyMutationsAnswerAndEndAsInAPlainModel) {
    auto const fresh = makeArray("fresh.array", topology);
    auto const path = at("test.array");
    EXPECT_TRUE(rc::check("mutations agree with the model", [&](std::vector<Step> const &steps) {
        std::filesystem::copy_file(fresh, path, std::filesystem::copy_options::overwrite_existing);
        Sequence sequence(path);
        for (auto const &step : steps) {
            sequence.perform(step);
        }
        sequence.compare(path);
    }));
}

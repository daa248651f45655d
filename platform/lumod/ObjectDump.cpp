// SPDX-License-Identifier: Apache-2.0
#include "ObjectDump.h"

#include <string>

#include <fmt/format.h>
#include <rapidjson/stringbuffer.h>
#include <rapidjson/writer.h>

#include "Escape.h"

namespace Lumod {

namespace {

/// One JSON object on one line.
class Line {
public:
    explicit Line(char const *object) {
        writer_.StartObject();
        text("object", object);
    }

    Line &text(char const *key, std::string_view value) {
        writer_.Key(key);
        string(value);
        return *this;
    }
    Line &number(char const *key, int64_t value) {
        writer_.Key(key);
        writer_.Int64(value);
        return *this;
    }
    Line &boolean(char const *key, bool value) {
        writer_.Key(key);
        writer_.Bool(value);
        return *this;
    }
    Line &flags(char const *key, std::map<std::string, bool> const &values) {
        writer_.Key(key);
        writer_.StartObject();
        for (auto const &[name, value] : values) {
            std::string const usable = repaired(name);
            writer_.Key(usable.data(), static_cast<rapidjson::SizeType>(usable.size()));
            writer_.Bool(value);
        }
        writer_.EndObject();
        return *this;
    }
    void write(Log &log, std::string_view trace) {
        writer_.EndObject();
        // Control characters are escaped by the writer; what is left is a line already.
        log.writeRaw(trace, fmt::format("dump {}", buffer_.GetString()));
    }

private:
    void string(std::string_view value) {
        std::string const usable = repaired(value);
        writer_.String(usable.data(), static_cast<rapidjson::SizeType>(usable.size()));
    }

    rapidjson::StringBuffer buffer_;
    /// ASCII, so that nothing in it can disturb a terminal.
    rapidjson::Writer<rapidjson::StringBuffer, rapidjson::UTF8<>, rapidjson::ASCII<>> writer_{buffer_};
};

int64_t millisecondsSince(Core const &core, kj::TimePoint moment) {
    return (core.timer.now() - moment) / kj::MILLISECONDS;
}

void dumpProvider(Core &core, std::string_view trace, ProviderEntry const &provider) {
    Line("provider")
        .text("name", provider.record.name)
        .text("url", provider.record.url)
        .text("status", provider.injected ? nameOf(*provider.injected) : "default")
        .text("unusable", provider.unusable ? provider.unusable->sentence() : std::string())
        .flags("injectedFlags", provider.injectedFlags)
        .flags("activations", provider.activations)
        .text("toldContext", provider.toldContext.value_or(""))
        .write(core.log, trace);
    for (Store::ProviderArray const &array : provider.record.arrays) {
        Line("providerArray")
            .text("provider", provider.record.name)
            .text("array", array.arrayId)
            .boolean("isActive", provider.isActiveFor(array.arrayId))
            .number("priority", array.priority)
            .write(core.log, trace);
    }
}

} // namespace

void dumpObjects(Core &core, std::string_view trace) {
    auto const snapshot = core.host.lastKnown();
    Line("daemon")
        .text("version", core.settings.version)
        .text("root", core.settings.root)
        .number("uptimeMs", millisecondsSince(core, core.started))
        .text("logLevel", nameOf(core.log.level()))
        .number("unbindPeriodUs", core.unbindTimer.period() / kj::MICROSECONDS)
        .boolean("modifiesProfiles", core.services.modifiesProfiles)
        .boolean("faultInjection", core.faults.enabled())
        .boolean("mutationInProgress", core.mutations.isBusy())
        .number("mutationsWaiting", static_cast<int64_t>(core.mutations.length()))
        .text("orkaContext", snapshot ? snapshot->orkaContext.value_or("") : std::string())
        .write(core.log, trace);
    for (ProviderPtr const &provider : core.providers.all()) {
        dumpProvider(core, trace, *provider);
    }
    for (auto const &[array, provider] : core.providers.activated()) {
        Line("activation").text("array", array).text("provider", provider).write(core.log, trace);
    }
    for (FaultRules::Rule const &rule : core.faults.rules()) {
        Line("faultRule")
            .text("fault", nameOf(rule.fault))
            .text("operation", rule.operation ? nameOf(*rule.operation) : "*")
            .number("frequency", rule.frequency)
            .number("timeMs", rule.timeMs)
            .number("seen", rule.seen)
            .number("fired", rule.fired)
            .write(core.log, trace);
    }
    for (std::string const &uid : core.outages.all()) {
        Line("endpointOutage").text("endpoint", uid).write(core.log, trace);
    }
    for (auto const &[uuid, waiting] : core.unbindTimer.waiting()) {
        Line("waitingUnbind")
            .text("volume", uuid)
            .text("container", waiting.containerId)
            .number("waitedMs", millisecondsSince(core, waiting.since))
            .write(core.log, trace);
    }
}

} // namespace Lumod

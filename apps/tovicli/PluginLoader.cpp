// SPDX-License-Identifier: Apache-2.0
#include "PluginLoader.h"

#include <dlfcn.h>
#include <exception>
#include <utility>

#include "ElfFile.h"
#include "FailureText.h"
#include "kestrel/Lib.h"

namespace Tovicli {

namespace {

std::string loaderText() {
    char const *text = dlerror();
    return text != nullptr ? text : "unknown error";
}

std::chrono::microseconds since(std::chrono::steady_clock::time_point began) {
    return std::chrono::duration_cast<std::chrono::microseconds>(std::chrono::steady_clock::now() - began);
}

/// Calls an entry point. @return why it failed, empty when it did not
template <typename Call>
std::string reasonOf(Call const &call) {
    try {
        call();
        return {};
    } catch (std::exception const &failure) {
        return textOf(failure);
    } catch (...) {
        return "an exception of an unknown kind";
    }
}

} // namespace

PluginLoader::PluginLoader(std::string libraryDirectory, uid_t user)
    : platform_(std::move(libraryDirectory))
    , user_(user) {}

Registration PluginLoader::registerInto(boost::shared_ptr<Plexa::AutoCli::Namespace> &root,
                                        std::string const &directory, Environment &environment) {
    Directory &loaded = load(directory);
    Registration registration;
    registration.troubles = loaded.troubles;
    for (Plugin &plugin : loaded.plugins) {
        registerPlugin(plugin, root, environment, registration);
    }
    return registration;
}

PluginLoader::Directory &PluginLoader::load(std::string const &path) {
    auto const [position, isNew] = directories_.try_emplace(path);
    Directory &loaded = position->second;
    if (!isNew) {
        return loaded;
    }
    PluginDirectory opened = openPluginDirectory(path, user_);
    if (!opened.problem.empty()) {
        loaded.troubles.push_back("no plug-ins from '" + path + "': " + opened.problem);
        return loaded;
    }
    loaded.troubles = std::move(opened.skipped);
    for (PluginFile &file : opened.files) {
        Plugin plugin{file.name, nullptr, {}};
        auto const began = std::chrono::steady_clock::now();
        if (std::string const problem = loadPlugin(file, plugin.entry); !problem.empty()) {
            loaded.troubles.push_back("plug-in '" + file.name + "' skipped: " + problem);
        } else {
            plugin.loading = since(began);
            loaded.plugins.push_back(std::move(plugin));
        }
    }
    return loaded;
}

std::string PluginLoader::loadPlugin(PluginFile &file, EntryPoint &entry) {
    int const descriptor = file.descriptor.number();
    ElfFile const elf = readElfFile(descriptor);
    if (!elf.problem.empty()) {
        return elf.problem;
    }
    if (std::string const problem = platform_.provide(elf.needed); !problem.empty()) {
        return problem;
    }
    std::string const path = "/proc/self/fd/" + std::to_string(descriptor);
    void *const library = dlopen(path.c_str(), RTLD_LAZY | RTLD_LOCAL);
    if (library == nullptr) {
        return loaderText();
    }
    // The system's loader knows the library by this path, and by the file's inode, as long as it is loaded, which is
    // until the process ends: a number or an inode that is used again would stand for the earlier library.
    file.descriptor.keepForever();
    void *const symbol = dlsym(library, "AutoCli_RegisterNamespaces");
    if (symbol == nullptr) {
        return "it has no entry point AutoCli_RegisterNamespaces";
    }
    entry = reinterpret_cast<EntryPoint>(symbol);
    return {};
}

void PluginLoader::registerPlugin(Plugin &plugin, boost::shared_ptr<Plexa::AutoCli::Namespace> &root,
                                  Environment &environment, Registration &registration) {
    auto const began = std::chrono::steady_clock::now();
    std::string const reason = reasonOf([&] {
        try {
            plugin.entry(root);
        } catch (Kestrel::Lib::KestrelException const &) {
            // No daemon session. Offline, sessions open without a daemon; what was registered so far is found again.
            if (environment.get("TOVI_OFFLINE")) {
                throw;
            }
            registration.daemonMissing = true;
            registration.daemonFailure = lastFailure();
            environment.set("TOVI_OFFLINE", "1");
            plugin.entry(root);
        }
    });
    registration.plugins.push_back({plugin.name, std::exchange(plugin.loading, {}), since(began)});
    if (!reason.empty()) {
        registration.troubles.push_back("plug-in '" + plugin.name + "' failed: " + reason);
    }
}

std::optional<LastFailure> PluginLoader::lastFailure() {
    return platform_.lastFailure();
}

void PluginLoader::clearLastFailure() {
    platform_.clearLastFailure();
}

ProgressFunction PluginLoader::startProgress() {
    return platform_.startProgress();
}

void PluginLoader::traceRequests(std::function<void(RequestDone const &)> receiver) {
    platform_.traceRequests(std::move(receiver));
}

} // namespace Tovicli

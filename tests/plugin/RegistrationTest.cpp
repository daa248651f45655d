// SPDX-License-Identifier: Apache-2.0
//
// The tree that the entry point hangs below "storage".
#include <map>

#include "CommandTest.h"
#include "Declarations.h"
#include "VendorProviderAdd.h"
#include "plexa/AutoCli.h"

using namespace PluginTest;
using Plexa::AutoCli::Namespace;
using Plexa::AutoCli::NamespaceNode;

namespace {

class Registration : public CommandTest {
protected:
    Registration() {
        root->RegisterNamespaceNode(storage, "storage");
        storage->SetDescription("The framework's own");
    }
    /// All paths below a node, in tree order.
    static void collect(NamespaceNode &node, std::vector<std::string> &paths) {
        for (auto const &child : node.GetNamespaceNodes()) {
            paths.push_back(child->GetPathString(' '));
            collect(*child, paths);
        }
    }
    std::vector<std::string> paths() const {
        std::vector<std::string> result;
        collect(*root, result);
        return result;
    }
    boost::shared_ptr<NamespaceNode> at(std::string const &path) const {
        boost::shared_ptr<NamespaceNode> node = root;
        for (std::size_t begin = 0; begin < path.size();) {
            std::size_t const end = std::min(path.find(' ', begin), path.size());
            node = node->GetNamespaceNode(path.substr(begin, end - begin));
            if (!node) {
                throw std::runtime_error("no node " + path);
            }
            begin = end + 1;
        }
        return node;
    }
    void TearDown() override {
        root.reset();
        storage.reset();
        CommandTest::TearDown();
    }

    boost::shared_ptr<Namespace> root = Namespace::New();
    boost::shared_ptr<Namespace> storage = Namespace::New();
};

TEST_F(Registration, BuildsTheWholeTreeInOrder) {
    AutoCli_RegisterNamespaces(root);
    std::string const top = "storage internal lumo";
    EXPECT_THAT(
        paths(),
        ElementsAre("storage", "storage internal", top, top + " orkaprovider", top + " orkaprovider add",
                    top + " orkaprovider set", top + " orkaprovider remove", top + " orkaprovider activate",
                    top + " orkaprovider deactivate", top + " orkaprovider injectfault", top + " faultInjection",
                    top + " faultInjection enable", top + " faultInjection rule", top + " faultInjection rule add",
                    top + " faultInjection rule set", top + " faultInjection rule remove", top + " storagecontainer",
                    top + " storagecontainer load", top + " storagecontainer add", top + " storagecontainer remove",
                    top + " storagecontainer checklumos", top + " configlumo", top + " configlumo add",
                    top + " configlumo remove", top + " configlumo umount", top + " configlumo mount", top + " daemon",
                    top + " daemon set", top + " orkacontext", top + " orkacontext set", top + " virtualvolume",
                    top + " virtualvolume get", top + " virtualvolume metadata", top + " virtualvolume metadata list"));
}

TEST_F(Registration, DescribesEveryNamespace) {
    AutoCli_RegisterNamespaces(root);
    std::map<std::string, std::string> const descriptions = {
        {"storage", "The framework's own"},
        {"storage internal", "Tarsel internal storage commands."},
        {"storage internal lumo", "Operations pertaining to Virtual Volumes"},
        {"storage internal lumo orkaprovider", "Manage Lumo Orka Provider Operations."},
        {"storage internal lumo faultInjection", "Manage fault injection."},
        {"storage internal lumo faultInjection rule", ""},
        {"storage internal lumo storagecontainer",
         "Operations to create, manage, remove and restore Lumo StorageContainers."},
        {"storage internal lumo configlumo", "Operations pertaining to config-lumos."},
        {"storage internal lumo daemon",
         "Operations pertaining to Lumo daemon to  set LogLevel,unbind timer and dump objects."},
        {"storage internal lumo orkacontext", "Operations on the Lumo Orka context."},
        {"storage internal lumo virtualvolume", "Operations on a specific virtual volume."},
        {"storage internal lumo virtualvolume metadata", "Operations on the metadata for a specific virtual volume."},
    };
    for (auto const &[path, description] : descriptions) {
        EXPECT_EQ(at(path)->GetDescription(), description) << path;
        EXPECT_EQ(at(path)->GetType(), "namespace") << path;
    }
}

TEST_F(Registration, PutsEachCommandClassWhereItBelongs) {
    AutoCli_RegisterNamespaces(root);
    for (Declaration const &declaration : allDeclarations()) {
        if (declaration.path.empty()) {
            continue;
        }
        auto const made = declaration.make();
        auto const registered = at(declaration.path);
        Plexa::AutoCli::Command &expected = *made;
        NamespaceNode &found = *registered;
        EXPECT_EQ(typeid(found), typeid(expected)) << declaration.path;
        EXPECT_EQ(found.GetDescription(), declaration.description) << declaration.path;
    }
}

TEST_F(Registration, LeadsToNoConsistencyGroup) {
    AutoCli_RegisterNamespaces(root);
    for (std::string const &path : paths()) {
        for (Declaration const &declaration : groupDeclarations()) {
            EXPECT_NE(at(path)->GetDescription(), declaration.description) << path;
        }
    }
}

TEST_F(Registration, OpensOneSessionForEachCommandThatHoldsOne) {
    AutoCli_RegisterNamespaces(root);
    EXPECT_EQ(lumo.openSessions, 7);
    root.reset();
    storage.reset();
    EXPECT_EQ(lumo.openSessions, 0);
}

TEST_F(Registration, KeepsAnInternalThatIsThereAndItsDescription) {
    auto const internal = Namespace::New();
    internal->SetDescription("somebody else's");
    internal->RegisterNamespaceNode(Namespace::New(), "other");
    storage->RegisterNamespaceNode(internal, "internal");
    AutoCli_RegisterNamespaces(root);
    EXPECT_EQ(storage->GetNamespaceNodes().size(), 1U);
    EXPECT_EQ(at("storage internal"), internal);
    EXPECT_EQ(internal->GetDescription(), "somebody else's");
    EXPECT_THAT(internal->GetNamespaceNodeNames(), ElementsAre("other", "lumo"));
}

TEST_F(Registration, NeedsStorageAndSaysWhereItLooked) {
    for (std::string const name : {"", "root of all"}) {
        auto bare = Namespace::New();
        bare->SetName(name);
        try {
            AutoCli_RegisterNamespaces(bare);
            FAIL() << "nothing was thrown";
        } catch (Gantry::Lib::GantryException const &failure) {
            EXPECT_EQ(failure.GetMessage(), "Unable to find 'storage' namespace in namespace '" + name + "'");
        }
        EXPECT_THAT(bare->GetNamespaceNodes(), IsEmpty());
    }
    EXPECT_THAT(log.lines(), IsEmpty());
}

TEST_F(Registration, StopsAtTheFirstCommandWithoutASessionAndLeavesInternalAlone) {
    lumo.init.always(false);
    expectNoSession([&] { AutoCli_RegisterNamespaces(root); }, "VendorProviderRemove", 35U);
    EXPECT_THAT(paths(), ElementsAre("storage", "storage internal"));
    EXPECT_THAT(log.lines(), ElementsAre("LumoLib_Init(0, 0)"));
}

TEST_F(Registration, StopsAtAnyCommandWithoutASessionAndClosesTheSessionsBeforeIt) {
    struct Unit {
        char const *name;
        unsigned line;
    };
    std::size_t before = 0;
    for (Unit const &unit :
         {Unit{"VendorProviderRemove", 35}, Unit{"VendorProviderActivate", 36}, Unit{"VendorProviderDeactivate", 36},
          Unit{"StorageContainerLoad", 42}, Unit{"StorageContainerRemove", 31}, Unit{"StorageContainerCheckLumos", 40},
          Unit{"DaemonCommand", 38}}) {
        for (std::size_t i = 0; i < before; ++i) {
            lumo.init.once(true);
        }
        lumo.init.once(false);
        expectNoSession([&] { AutoCli_RegisterNamespaces(root); }, unit.name, unit.line);
        EXPECT_THAT(paths(), ElementsAre("storage", "storage internal"));
        EXPECT_EQ(lumo.openSessions, 0);
        ++before;
    }
}

using RegistrationDeathTest = Registration;

// Nothing tests what is found under the two names: whoever puts a command there stops the tool.
TEST_F(RegistrationDeathTest, StorageThatIsACommandIsFatal) {
    auto bare = Namespace::New();
    bare->RegisterNamespaceNode(TarselCli::LumoNamespace::VendorProviderAdd::New(), "storage");
    EXPECT_DEATH(AutoCli_RegisterNamespaces(bare), "");
}

TEST_F(RegistrationDeathTest, InternalThatIsACommandIsFatal) {
    storage->RegisterNamespaceNode(TarselCli::LumoNamespace::VendorProviderAdd::New(), "internal");
    EXPECT_DEATH(AutoCli_RegisterNamespaces(root), "");
}

} // namespace

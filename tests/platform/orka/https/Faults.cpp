// SPDX-License-Identifier: Apache-2.0
//
// What a provider may do wrong, and what comes of it. The numbers are those of docs/faults.md.
#include <filesystem>

#include "HttpsFixture.h"

namespace {

using Orka::VolumeSpec;
using Orkasim::Misdeed;
using Wire::ErrorCode;

class ProviderFaultTest : public HttpsTest {
protected:
    VolumeSpec spec(std::string name) {
        VolumeSpec made;
        made.containerId = goldId;
        made.directoryName = std::move(name);
        return made;
    }
    int64_t configVolumes() {
        return Orka::ArrayFile(at("test.array")).counts().configVolumes;
    }
};

TEST_F(ProviderFaultTest, fault_35_aServerThatNeverAnswersCostsTheDeadlineAndNoMore) {
    misbehave(Misdeed::Hang);
    EXPECT_EQ(sentence(client_->queryStorageArray(context("", 3 * kj::SECONDS))),
              "the provider at array.test:8443 did not answer queryStorageArray before the deadline");
    EXPECT_EQ(code_, ErrorCode::DeadlineExceeded);
    EXPECT_EQ(took_, 3 * kj::SECONDS);
}

TEST_F(ProviderFaultTest, fault_35_aServerThatNeverAcceptsOrNeverShakesHandsIsNamedAsThat) {
    serve();
    network_.way = FakeNetwork::Way::Silent;
    EXPECT_EQ(sentence(client_->queryStorageArray(context("", 3 * kj::SECONDS))),
              "the provider at array.test:8443 accepted no connection before the deadline of queryStorageArray");
    EXPECT_EQ(took_, 3 * kj::SECONDS);
    network_.way = FakeNetwork::Way::Open;
    kj::Vector<kj::Own<kj::AsyncIoStream>> held;
    network_.onConnection = [&held](kj::Own<kj::AsyncIoStream> stream) { held.add(kj::mv(stream)); };
    EXPECT_EQ(sentence(client_->queryStorageArray(context("", 3 * kj::SECONDS))),
              "the provider at array.test:8443 did not agree on TLS before the deadline of queryStorageArray");
    EXPECT_EQ(took_, 3 * kj::SECONDS);
}

TEST_F(ProviderFaultTest, fault_35_othersAreNotKeptWaiting) {
    serve({0 * kj::SECONDS, 0, 1, Misdeed::Hang, "getMetadata", std::nullopt});
    auto hanging = client_->getMetadata(context(), goldId, webId);
    EXPECT_FALSE(hanging.poll(wait_));
    EXPECT_EQ(get(client_->queryStorageArray(context())).items->size(), 2U);
    EXPECT_EQ(took_, 0 * kj::SECONDS);
}

TEST_F(ProviderFaultTest, fault_36_aSlowDripEndsAtTheDeadline) {
    misbehave(Misdeed::Drip);
    EXPECT_EQ(sentence(client_->queryStorageArray(context("", 5 * kj::SECONDS))),
              "the provider at array.test:8443 did not finish its answer to queryStorageArray before the deadline");
    EXPECT_EQ(code_, ErrorCode::DeadlineExceeded);
    EXPECT_EQ(took_, 5 * kj::SECONDS);
}

TEST_F(ProviderFaultTest, fault_37_aBodyWithoutAnEndOrOfTenGigabytesIsCutOff) {
    for (auto const misdeed : {Misdeed::Endless, Misdeed::Huge}) {
        misbehave(misdeed);
        EXPECT_EQ(sentence(newClient()->queryStorageArray(context())),
                  "the provider at array.test:8443 answered queryStorageArray with more than the 16 MiB that an answer "
                  "may have");
        EXPECT_EQ(code_, ErrorCode::ProtocolError);
        EXPECT_EQ(took_, 0 * kj::SECONDS);
    }
}

TEST_F(ProviderFaultTest, fault_37_pagesWithoutAnEndAreCutOff) {
    serveText(200, R"({"version": "1", "unchanged": false, "items": [], "nextPage": "more"})");
    EXPECT_EQ(sentence(client_->queryStorageArray(context())),
              "the provider at array.test:8443 answered queryStorageArray with an empty page and a next one");
    EXPECT_EQ(code_, ErrorCode::ProtocolError);
}

TEST_F(ProviderFaultTest, fault_38_aCompressedBodyIsRefusedAndNotUnpacked) {
    misbehave(Misdeed::Bomb);
    EXPECT_EQ(sentence(client_->queryStorageArray(context())),
              "the provider at array.test:8443 answered queryStorageArray in an encoding that it was not asked for");
    EXPECT_EQ(code_, ErrorCode::ProtocolError);
}

TEST_F(ProviderFaultTest, fault_39_garbageAndHalfADocumentAreTyped) {
    misbehave(Misdeed::Garbage);
    EXPECT_EQ(
        sentence(client_->queryStorageArray(context())),
        "the provider at array.test:8443 gave an answer that is not what it should be: queryStorageArray: line 1, "
        "column 1: Invalid value.");
    EXPECT_EQ(code_, ErrorCode::ProtocolError);
    misbehave(Misdeed::Truncated);
    EXPECT_EQ(
        sentence(newClient()->queryStorageArray(context())),
        "the provider at array.test:8443 gave an answer that is not what it should be: queryStorageArray: line 1, "
        "column 52: Missing a closing quotation mark in string.");
    EXPECT_EQ(code_, ErrorCode::ProtocolError);
}

TEST_F(ProviderFaultTest, fault_39_whatIsJsonAndNotTheAnswerIsNamedByItsPath) {
    struct Lie {
        char const *body;
        char const *what;
    };
    for (auto const &[body, what] : {
             Lie{R"([])", "the document: an object is expected, not a list"},
             Lie{R"({"unchanged": false, "items": []})", "the document: the member \"version\" is missing"},
             Lie{R"({"version": null, "unchanged": false, "items": []})",
                 "the document: the member \"version\" is missing"},
             Lie{R"({"version": "1", "unchanged": false, "items": [{"id": "x"}]})",
                 "items[0].id: a UUID is expected, not \"x\""},
             Lie{R"({"version": "1", "unchanged": false, "items": [{"id": "00000000-0000-4000-8000-00000000000a",
                 "name": "n", "maxLumoSizeMb": -1, "arrayIds": []}]})",
                 "items[0].maxLumoSizeMb: a whole number from 0 to 9223372036854775807 is expected, not -1"},
             Lie{"{\"version\": \"\xff\", \"unchanged\": false, \"items\": []}",
                 "line 1, column 14: Invalid encoding in string."},
         }) {
        serveText(200, body);
        EXPECT_EQ(sentence(newClient()->queryStorageContainer(context())),
                  std::string("the provider at array.test:8443 gave an answer that is not what it should be: "
                              "queryStorageContainer: ") +
                      what);
        EXPECT_EQ(code_, ErrorCode::ProtocolError);
    }
    serveText(200, R"({"blockSize": 512, "bitmap": "no base64"})");
    EXPECT_EQ(sentence(newClient()->unsharedChunksVirtualVolume(context(), goldId, webId)),
              "the provider at array.test:8443 gave an answer that is not what it should be: "
              "unsharedChunksVirtualVolume: bitmap: base64 is expected");
    serveText(200, R"({"volume": {"uuid": "10000000-0000-4000-8000-000000000001",
        "containerId": "00000000-0000-4000-8000-00000000000a", "kind": "neither"}})");
    EXPECT_EQ(sentence(newClient()->queryVirtualVolumeByDirectoryName(context(), goldId, "web")),
              "the provider at array.test:8443 gave an answer that is not what it should be: "
              "queryVirtualVolumeByDirectoryName: volume.kind: \"config\" or \"data\" is expected, not \"neither\"");
    serveText(200, R"({"items": {}})");
    EXPECT_EQ(sentence(newClient()->getMetadata(context(), goldId, webId)),
              "the provider at array.test:8443 gave an answer that is not what it should be: "
              "getMetadata: items: a list is expected, not an object");
    serveText(200, R"({"version": "1", "unchanged": true, "items": []})");
    EXPECT_EQ(sentence(newClient()->queryStorageContainer(context())),
              "the provider at array.test:8443 answered queryStorageContainer that nothing has changed, of a version "
              "that was not asked about");
    serveText(200, "<html>", "text/html");
    EXPECT_EQ(sentence(newClient()->queryStorageContainer(context())),
              "the provider at array.test:8443 answered queryStorageContainer with something that is not JSON");
    serveText(200, R"({"items": []})");
    EXPECT_EQ(sentence(newClient()->queryVirtualVolumesById(context(), goldId, {webId})),
              "the provider at array.test:8443 answered queryVirtualVolumesById about 0 of 1 ids");
}

TEST_F(ProviderFaultTest, fault_40_anExpiredCertificateIsRefusedThoughItIsPinned) {
    Orkasim::CertificateSpec expired;
    expired.names = {"array.test"};
    expired.validFrom = std::chrono::hours(-48);
    expired.validUntil = std::chrono::hours(-24);
    serve({}, expired);
    EXPECT_EQ(sentence(client_->queryStorageArray(context())),
              "the provider at array.test:8443 showed a certificate that is not trusted: certificate has expired");
    EXPECT_EQ(code_, ErrorCode::ProviderUnreachable);
    EXPECT_EQ(requests_, 0);
}

TEST_F(ProviderFaultTest, fault_40_aCertificateThatNobodyVouchesForIsRefused) {
    serve();
    std::filesystem::remove(at("certs/array.test_8443.pem"));
    std::string const untrusted =
        "the provider at array.test:8443 showed a certificate that is not trusted: self-signed certificate; ";
    auto const file = "'" + at("certs/array.test_8443.pem") + "'";
    EXPECT_EQ(sentence(client_->queryStorageArray(context())), untrusted + "it would have to be pinned in " + file);
    EXPECT_EQ(requests_, 0);
    Orkasim::CertificateSpec other;
    other.names = {"array.test"};
    pin(Orkasim::makeIdentity(other).certificate);
    EXPECT_EQ(sentence(client_->queryStorageArray(context())), untrusted + file + " does not vouch for it");
    EXPECT_EQ(requests_, 0);
}

TEST_F(ProviderFaultTest, fault_40_aCertificateOfAnotherHostIsRefusedThoughItIsPinned) {
    Orkasim::CertificateSpec other;
    other.names = {"elsewhere.test"};
    serve({}, other);
    EXPECT_EQ(sentence(client_->queryStorageArray(context())),
              "the provider at array.test:8443 showed a certificate that is not trusted: hostname mismatch");
    EXPECT_EQ(requests_, 0);
}

TEST_F(ProviderFaultTest, fault_40_aPinnedFileThatIsNoCertificateTrustsNobody) {
    serve();
    pin("rubbish");
    EXPECT_EQ(sentence(client_->queryStorageArray(context())),
              "the pinned certificate '" + at("certs/array.test_8443.pem") + "' is no certificate in PEM");
    EXPECT_EQ(code_, ErrorCode::FileMalformed);
}

TEST_F(ProviderFaultTest, fault_40_aCertificateThatIsPinnedLaterCountsFromThenOn) {
    serve();
    auto const pem = bytesOf(at("certs/array.test_8443.pem"));
    std::filesystem::remove(at("certs/array.test_8443.pem"));
    EXPECT_NE(sentence(client_->queryStorageArray(context())), "");
    pin(pem);
    EXPECT_EQ(sentence(client_->queryStorageArray(context())), "");
}

TEST_F(ProviderFaultTest, fault_41_aRedirectIsRefusedAndNothingIsSentOn) {
    misbehave(Misdeed::Redirect);
    EXPECT_EQ(sentence(client_->createVirtualVolume(context("key"), spec("new"))),
              "the provider at array.test:8443 answered createVirtualVolume with a redirect (307), which is refused");
    EXPECT_EQ(code_, ErrorCode::ProtocolError);
    EXPECT_EQ(network_.connections, 1);
    EXPECT_EQ(requests_, 0);
}

TEST_F(ProviderFaultTest, fault_42_aResetAfterTheCommitLeavesOneObject) {
    misbehave(Misdeed::Reset, 2);
    auto const before = configVolumes();
    auto const made = get(client_->createVirtualVolume(context("key"), spec("new")));
    EXPECT_EQ(made.directoryName, "new");
    EXPECT_EQ(requests_, 3);
    EXPECT_EQ(configVolumes(), before + 1);
    EXPECT_EQ(get(client_->queryVirtualVolume(context(), goldId, made.uuid)), made);
}

TEST_F(ProviderFaultTest, fault_42_aChangeWithoutAKeyIsNotRepeated) {
    misbehave(Misdeed::Reset, 1);
    EXPECT_EQ(sentence(client_->createVirtualVolume(context(), spec("new"))),
              "the provider at array.test:8443 answered createVirtualVolume by breaking the connection");
    EXPECT_EQ(code_, ErrorCode::ProviderUnreachable);
    EXPECT_EQ(requests_, 1);
}

TEST_F(ProviderFaultTest, fault_43_aStormOf503IsMetWithFourTriesAndThenWithOne) {
    misbehave(Misdeed::Unavailable);
    EXPECT_EQ(sentence(client_->queryStorageArray(context())), "the array is overloaded");
    EXPECT_EQ(code_, ErrorCode::ProviderBusy);
    EXPECT_EQ(took_, 700 * kj::MILLISECONDS);
    EXPECT_EQ(sentence(client_->queryStorageArray(context())), "the array is overloaded");
    EXPECT_EQ(took_, 0 * kj::MILLISECONDS);
}

TEST_F(ProviderFaultTest, fault_43_aShortStormPassesUnnoticed) {
    misbehave(Misdeed::Unavailable, 3);
    EXPECT_EQ(get(client_->queryStorageArray(context())).items->size(), 2U);
    EXPECT_EQ(took_, 700 * kj::MILLISECONDS);
    EXPECT_EQ(requests_, 1);
}

TEST_F(ProviderFaultTest, fault_43_theDeadlineEndsTheTries) {
    misbehave(Misdeed::Unavailable);
    EXPECT_EQ(sentence(client_->queryStorageArray(context("", 250 * kj::MILLISECONDS))),
              "the array is overloaded; the deadline came before it could be asked again");
    EXPECT_EQ(took_, 250 * kj::MILLISECONDS);
}

TEST_F(ProviderFaultTest, fault_44_aLookupThatHangsEndsAtTheDeadlineAndIsNotBegunTwice) {
    serve();
    network_.way = FakeNetwork::Way::LookupHangs;
    for (int count = 0; count < 3; ++count) {
        EXPECT_EQ(sentence(client_->queryStorageArray(context("", 2 * kj::SECONDS))),
                  "the provider at array.test:8443 was not found before the deadline of queryStorageArray: its name is "
                  "still being looked up");
        EXPECT_EQ(code_, ErrorCode::DeadlineExceeded);
        EXPECT_EQ(took_, 2 * kj::SECONDS);
    }
    EXPECT_EQ(network_.lookups, 1);
    network_.way = FakeNetwork::Way::Open;
    timer_.advanceTo(timer_.now() + 61 * kj::SECONDS);
    EXPECT_EQ(sentence(client_->queryStorageArray(context())), "");
}

TEST_F(ProviderFaultTest, aServerThatIsNotThereIsToldAtOnce) {
    serve();
    network_.way = FakeNetwork::Way::Refuses;
    EXPECT_EQ(sentence(client_->queryStorageArray(context())),
              "the provider at array.test:8443 cannot be reached: Connection refused");
    EXPECT_EQ(took_, 0 * kj::SECONDS);
    EXPECT_EQ(code_, ErrorCode::ProviderUnreachable);
    network_.way = FakeNetwork::Way::LookupFails;
    EXPECT_EQ(sentence(client_->queryStorageArray(context())),
              "the provider at array.test:8443 cannot be found: Name or service not known");
}

} // namespace

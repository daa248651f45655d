// SPDX-License-Identifier: Apache-2.0
//
// What lies between a socket and the service: connections that cannot be taken, and bytes that are no request.
#include "HttpsFixture.h"

#include <deque>

#include "serve/Server.h"

namespace {

/// A port whose first clients meet a system that has nothing left for them.
class ShortOfDescriptors final : public kj::ConnectionReceiver {
public:
    ShortOfDescriptors(int failures, kj::Exception::Type type)
        : failures_(failures)
        , type_(type) {}

    kj::Promise<kj::Own<kj::AsyncIoStream>> accept() override {
        if (failures_ > 0) {
            --failures_;
            kj::throwFatalException(kj::Exception(type_, __FILE__, __LINE__, kj::str("accept: Too many open files")));
        }
        if (!clients_.empty()) {
            auto client = kj::mv(clients_.front());
            clients_.pop_front();
            return kj::mv(client);
        }
        return kj::NEVER_DONE;
    }
    kj::uint getPort() override {
        return 8443;
    }
    void come(kj::Own<kj::AsyncIoStream> client) {
        clients_.push_back(kj::mv(client));
    }

private:
    int failures_;
    kj::Exception::Type type_;
    std::deque<kj::Own<kj::AsyncIoStream>> clients_;
};

class HttpsServerTest : public HttpsTest {
protected:
    Orkasim::Identity identity() {
        Orkasim::CertificateSpec spec;
        spec.names = {"array.test"};
        return Orkasim::makeIdentity(spec);
    }

    /// What comes back for bytes that a client sends, until the server closes the connection.
    std::string answerTo(std::string const &bytes) {
        kj::HttpServerSettings settings;
        settings.errorHandler = *service_;
        kj::HttpServer server(timer_, *table_, *service_, settings);
        auto pipe = kj::newTwoWayPipe();
        auto serving = server.listenHttp(kj::mv(pipe.ends[0])).eagerlyEvaluate([](kj::Exception &&) {});
        auto sending = pipe.ends[1]->write(bytes.data(), bytes.size()).eagerlyEvaluate([](kj::Exception &&) {});
        auto answer = pipe.ends[1]->readAllText();
        while (!answer.poll(wait_)) {
            KJ_IF_MAYBE (next, timer_.nextEvent()) {
                timer_.advanceTo(*next);
            } else {
                ADD_FAILURE() << "the connection stays open";
                return "";
            }
        }
        return answer.wait(wait_).cStr();
    }
};

TEST_F(HttpsServerTest, fault_62_withoutDescriptorsItWaitsAndGoesOn) {
    auto const ours = identity();
    pin(ours.certificate);
    auto port = kj::heap<ShortOfDescriptors>(3, kj::Exception::Type::OVERLOADED);
    network_.onConnection = [&port = *port](kj::Own<kj::AsyncIoStream> stream) { port.come(kj::mv(stream)); };
    Orkasim::Server server(kj::mv(port), ours, *service_, *service_, timer_);
    auto running =
        server.run().eagerlyEvaluate([](kj::Exception &&exception) { ADD_FAILURE() << kj::str(exception).cStr(); });
    EXPECT_EQ(get(client_->queryStorageArray(context())).items->size(), 2U);
    EXPECT_EQ(took_, 300 * kj::MILLISECONDS);
    client_.reset();
}

TEST_F(HttpsServerTest, endsWhenItsPortIsGone) {
    auto port = kj::heap<ShortOfDescriptors>(1, kj::Exception::Type::FAILED);
    Orkasim::Server server(kj::mv(port), identity(), *service_, *service_, timer_);
    auto ended = server.run();
    ASSERT_TRUE(ended.poll(wait_));
    EXPECT_ANY_THROW(ended.wait(wait_));
}

TEST_F(HttpsServerTest, refusesInJsonWhatIsNoRequest) {
    struct Case {
        char const *bytes;
        char const *status;
        char const *body;
    };
    for (auto const &[bytes, status, body] : {
             Case{"GARBAGE\r\n\r\n", "HTTP/1.1 501 Not Implemented\r\n",
                  R"({"error":{"code":"invalidArgument","message":"the request cannot be read: Unrecognized request )"
                  R"(method."}})"},
             Case{"POST /orka/v1/setContext HTTP/1.1\r\nContent-Type: application/json\r\n"
                  "Transfer-Encoding: chunked\r\n\r\nzz\r\n{}\r\n0\r\n\r\n",
                  "HTTP/1.1 400 Bad Request\r\n",
                  R"({"error":{"code":"invalidArgument","message":"the request's body is not HTTP"}})"},
         }) {
        auto const answer = answerTo(bytes);
        EXPECT_TRUE(answer.starts_with(status)) << answer;
        EXPECT_NE(answer.find("Content-Type: application/json\r\n"), std::string::npos) << answer;
        EXPECT_TRUE(answer.ends_with(std::string("\r\n\r\n") + body)) << answer;
    }
}

TEST_F(HttpsServerTest, readsTheTypeOfABodyInAnyCaseAndWithParametersAndNoOther) {
    auto const answered = [this](std::string const &type) {
        auto const answer = answerTo("POST /orka/v1/setContext HTTP/1.1\r\nConnection: close\r\nContent-Type: " + type +
                                     "\r\nContent-Length: 2\r\n\r\n{}");
        return answer.substr(0, answer.find("\r\n"));
    };
    for (std::string const type : {"application/json", "Application/JSON", "application/json; charset=utf-8",
                                   "application/json;charset=utf-8", "application/json ;x=y"}) {
        EXPECT_EQ(answered(type), "HTTP/1.1 200 OK") << type;
    }
    for (std::string const type :
         {"application/jsonx", "application/json-patch+json", "application/jso", "text/plain"}) {
        EXPECT_EQ(answered(type), "HTTP/1.1 415 Unsupported Media Type") << type;
    }
}

} // namespace

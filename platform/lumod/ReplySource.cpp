// SPDX-License-Identifier: Apache-2.0
#include "ReplySource.h"

namespace Lumod {

namespace {

class SingleReply : public ReplySource {
public:
    explicit SingleReply(std::function<void(Wire::Reply::Builder)> fill)
        : fill_(std::move(fill)) {}
    bool next(Wire::Reply::Builder reply) override {
        fill_(reply);
        return false;
    }

private:
    std::function<void(Wire::Reply::Builder)> fill_;
};

} // namespace

ReplyPtr singleReply(std::function<void(Wire::Reply::Builder)> fill) {
    return std::make_unique<SingleReply>(std::move(fill));
}

ReplyPtr doneReply() {
    return singleReply([](Wire::Reply::Builder reply) { reply.setDone(); });
}

} // namespace Lumod

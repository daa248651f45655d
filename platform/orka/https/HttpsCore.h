// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <kj/refcount.h>

#include "https/BodyReader.h"
#include "https/BodyWriter.h"
#include "https/Exchange.h"
#include "https/HttpsProvider.h"
#include "https/Protocol.h"

namespace Orka::Https {

/// How often a list that changes while its pages are read is begun anew.
inline constexpr int listTriesMax = 4;

/// What an HTTPS provider and its pending promises share.
class HttpsProvider::Core final : public kj::Refcounted {
public:
    Core(Url url, ProviderSurroundings const &surroundings);

    /// One request and its answer. An idempotency key makes a change repeatable; what changes nothing is so anyway.
    template <typename AnswerType, typename Request>
    kj::Promise<Outcome<AnswerType>> call(char const *operation, CallContext const &context, bool isChange,
                                          Request const &request, bool *pageWasStale = nullptr) {
        using Result = Outcome<AnswerType>;
        auto asked = std::make_shared<Asked>();
        asked->operation = operation;
        asked->deadline = context.deadline;
        asked->mayBeRepeated = !isChange || !context.idempotencyKey.empty();
        auto body = outcomeOf([&] { return bodyOf(envelopeOf(context, isChange), request); });
        if (!body.ok()) {
            return Result(body.failure());
        }
        asked->body = std::move(body).value();
        return exchange_->ask(asked).then(
            [self = kj::addRef(*this), asked, pageWasStale](Outcome<std::string> &&answer) -> Result {
                if (pageWasStale != nullptr) {
                    *pageWasStale = asked->pageWasStale;
                }
                if (!answer.ok()) {
                    return answer.failure();
                }
                return self->template read<AnswerType>(asked->operation, answer.value());
            });
    }

    /// Every page of a list, the first `most` elements. Request has page and pageSize.
    template <typename T, typename Request>
    kj::Promise<Outcome<std::vector<T>>> pages(char const *operation, CallContext context, Request request,
                                               std::size_t most) {
        auto gathering = kj::refcounted<Gathering<PageAnswer<T>, Request>>(*this, operation, std::move(context),
                                                                           std::move(request), most);
        return gathering->go().then([](Outcome<PageAnswer<T>> &&whole) -> Outcome<std::vector<T>> {
            if (!whole.ok()) {
                return whole.failure();
            }
            return std::move(whole).value().items;
        });
    }

    /// What is known of each id, so many a request; `found` of the first ones already.
    kj::Promise<Outcome<std::vector<VolumePresence>>> presence(CallContext context, std::string containerId,
                                                               std::vector<std::string> uuids,
                                                               std::vector<VolumePresence> found);

    /// A list that the provider keeps, asked for only when it has changed.
    template <typename T>
    kj::Promise<Outcome<Listing<T>>> listing(char const *operation, CallContext context);

private:
    /// Reads page after page into one answer.
    template <typename PageType, typename Request>
    class Gathering final : public kj::Refcounted {
    public:
        Gathering(Core &core, char const *operation, CallContext context, Request request, std::size_t most)
            : core_(kj::addRef(core))
            , operation_(operation)
            , context_(std::move(context))
            , request_(std::move(request))
            , most_(most) {
            request_.pageSize = pageItemsMax;
        }

        kj::Promise<Outcome<PageType>> go() {
            return core_->template call<PageType>(operation_, context_, false, request_, &pageWasStale_)
                .then([self = kj::addRef(*this)](Outcome<PageType> &&page) mutable {
                    return self->take(std::move(page));
                });
        }

    private:
        kj::Promise<Outcome<PageType>> take(Outcome<PageType> &&page) {
            if (!page.ok()) {
                if (!pageWasStale_) {
                    return std::move(page);
                }
                return beginAnew();
            }
            auto value = std::move(page).value();
            if (request_.page) {
                if (changedMeanwhile(value)) {
                    return beginAnew();
                }
                std::move(value.items.begin(), value.items.end(), std::back_inserter(whole_.items));
                whole_.nextPage = std::move(value.nextPage);
                pageIsEmpty_ = value.items.empty();
            } else {
                pageIsEmpty_ = value.items.empty();
                whole_ = std::move(value);
            }
            if (whole_.items.size() > listItemsMax) {
                return Outcome<PageType>(core_->lie(operation_, "with a list that does not end"));
            }
            if (!whole_.nextPage || whole_.items.size() >= most_) {
                whole_.items.resize(std::min(most_, whole_.items.size()));
                return Outcome<PageType>(std::move(whole_));
            }
            if (pageIsEmpty_) {
                return Outcome<PageType>(core_->lie(operation_, "with an empty page and a next one"));
            }
            request_.page = whole_.nextPage;
            return go();
        }

        bool changedMeanwhile(PageType const &page) const {
            if constexpr (requires { page.version; }) {
                return page.version != whole_.version;
            }
            return false;
        }

        kj::Promise<Outcome<PageType>> beginAnew() {
            if (--triesLeft_ == 0) {
                return Outcome<PageType>(Wire::Failure(
                    Wire::ErrorCode::ProviderBusy, "the list that the provider at " + core_->exchange_->authority() +
                                                       " tells for " + operation_ + " changes faster than it is read"));
            }
            whole_ = PageType();
            request_.page.reset();
            return go();
        }

        kj::Own<Core> core_;
        char const *operation_;
        CallContext context_;
        Request request_;
        std::size_t most_;
        PageType whole_;
        bool pageWasStale_ = false;
        bool pageIsEmpty_ = false;
        int triesLeft_ = listTriesMax;
    };

    Envelope envelopeOf(CallContext const &context, bool isChange) const;
    Wire::Failure lie(char const *operation, std::string const &did) const;
    /// What the failure of a reader says, with the provider's name.
    Wire::Failure unreadable(Wire::Failure const &failure) const;

    template <typename AnswerType>
    Outcome<AnswerType> read(std::string const &operation, std::string const &body) const {
        try {
            AnswerType answer;
            readBody(body, operation, answer);
            return answer;
        } catch (Wire::Failure const &failure) {
            return unreadable(failure);
        }
    }

    template <typename T>
    std::shared_ptr<std::vector<T> const> &kept();

    kj::Own<Exchange> exchange_;
    kj::Timer &timer_;
    // The lists of the version that the provider told last, and our number for that version.
    std::string toldVersion_;
    uint64_t version_ = 0;
    std::shared_ptr<std::vector<StorageArray> const> arrays_;
    std::shared_ptr<std::vector<StorageContainer> const> containers_;
};

template <>
inline std::shared_ptr<std::vector<StorageArray> const> &HttpsProvider::Core::kept() {
    return arrays_;
}
template <>
inline std::shared_ptr<std::vector<StorageContainer> const> &HttpsProvider::Core::kept() {
    return containers_;
}

template <typename T>
kj::Promise<Outcome<Listing<T>>> HttpsProvider::Core::listing(char const *operation, CallContext context) {
    using Result = Outcome<Listing<T>>;
    ListRequest request;
    if (kept<T>()) {
        request.knownVersion = toldVersion_;
    }
    // What was kept when it was asked; another operation may put something else in its place meanwhile.
    auto gathering = kj::refcounted<Gathering<ListAnswer<T>, ListRequest>>(*this, operation, std::move(context),
                                                                           std::move(request), listItemsMax);
    auto &pending = *gathering;
    return pending.go().then([self = kj::addRef(*this), operation, known = kept<T>(), knownVersion = toldVersion_,
                              knownNumber = version_](Outcome<ListAnswer<T>> &&answer) mutable -> Result {
        if (!answer.ok()) {
            return answer.failure();
        }
        auto told = std::move(answer).value();
        if (told.unchanged) {
            if (!known || told.version != knownVersion) {
                return self->lie(operation, "that nothing has changed, of a version that was not asked about");
            }
            return Listing<T>{known, knownNumber};
        }
        auto &kept = self->template kept<T>();
        if (told.version != self->toldVersion_ || (kept && *kept != told.items)) {
            self->toldVersion_ = told.version;
            self->arrays_.reset();
            self->containers_.reset();
            ++self->version_;
        }
        if (!kept) {
            kept = std::make_shared<std::vector<T> const>(std::move(told.items));
        }
        return Listing<T>{kept, self->version_};
    });
}

} // namespace Orka::Https

// SPDX-License-Identifier: Apache-2.0
//
// One call of a command without a command line: an Input that records what is read from it and in which order, and an
// Output that records what is left in it.
#pragma once

#include "doubles/Answers.h"
#include "doubles/CallLog.h"
#include "plexa/CallSpec.h"

namespace Doubles {

class RecordingInput : public Plexa::CallSpec::Input {
public:
    explicit RecordingInput(CallLog &log)
        : log_(log) {}

    bool HasParameter(std::string const &name) const override;
    std::string GetString(std::string const &name) const override;
    int64_t GetInt(std::string const &name) const override;
    bool GetBool(std::string const &name) const override;
    std::vector<std::string> GetStringList(std::string const &name) const override;
    std::vector<int64_t> GetIntList(std::string const &name) const override;
    std::vector<bool> GetBoolList(std::string const &name) const override;

private:
    CallLog &log_;
};

class RecordingOutput : public Plexa::CallSpec::Output {
public:
    explicit RecordingOutput(CallLog &log)
        : log_(log) {}

    void SetMessage(std::string const &text) override;
    void SetResult(boost::shared_ptr<Plexa::MetaObj::MetaObject> const &result) override;
    void Complete() override;

    /// What SetResult and Complete do once they have recorded the call: nothing, or what the test has them throw.
    Answers<Done> onSetResult;
    Answers<Done> onComplete;

private:
    CallLog &log_;
};

/// A value as text: true, 12, "text", [element, ...], Name{field: value, ...}; `unset` for a scalar never set, `none`
/// for no value at all.
std::string render(boost::shared_ptr<Plexa::MetaObj::MetaObject> const &value);

/// A schema as text: bool, int, string, list of strings, list of Name{...}, Name{field: type, ...}; a scalar that holds
/// a value shows it, since a schema holds none.
std::string describe(boost::shared_ptr<Plexa::MetaObj::MetaObject> const &schema);

} // namespace Doubles

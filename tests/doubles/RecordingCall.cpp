// SPDX-License-Identifier: Apache-2.0
#include "doubles/RecordingCall.h"

namespace Doubles {

bool RecordingInput::HasParameter(std::string const &name) const {
    log_.call("Input.HasParameter", name);
    return Input::HasParameter(name);
}

std::string RecordingInput::GetString(std::string const &name) const {
    log_.call("Input.GetString", name);
    return Input::GetString(name);
}

int64_t RecordingInput::GetInt(std::string const &name) const {
    log_.call("Input.GetInt", name);
    return Input::GetInt(name);
}

bool RecordingInput::GetBool(std::string const &name) const {
    log_.call("Input.GetBool", name);
    return Input::GetBool(name);
}

std::vector<std::string> RecordingInput::GetStringList(std::string const &name) const {
    log_.call("Input.GetStringList", name);
    return Input::GetStringList(name);
}

std::vector<int64_t> RecordingInput::GetIntList(std::string const &name) const {
    log_.call("Input.GetIntList", name);
    return Input::GetIntList(name);
}

std::vector<bool> RecordingInput::GetBoolList(std::string const &name) const {
    log_.call("Input.GetBoolList", name);
    return Input::GetBoolList(name);
}

void RecordingOutput::SetMessage(std::string const &text) {
    log_.call("Output.SetMessage", text);
    Output::SetMessage(text);
}

void RecordingOutput::SetResult(boost::shared_ptr<Plexa::MetaObj::MetaObject> const &result) {
    log_.call("Output.SetResult", Verbatim{render(result)});
    onSetResult.next();
    Output::SetResult(result);
}

void RecordingOutput::Complete() {
    log_.call("Output.Complete");
    onComplete.next();
    Output::Complete();
}

} // namespace Doubles

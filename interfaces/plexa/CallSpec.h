// SPDX-License-Identifier: Apache-2.0
//
// One call of a command: what it takes (InputSpec), what it gives (OutputSpec), the arguments of this call (Input) and
// where it leaves its result (Output).
//
// The declaration is data: the argument parser, help and the formatters all read the same InputSpec and OutputSpec.
// Input and Output can be made, filled and derived from without a command line, so that a test calls a command
// directly and records what it reads and leaves.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include <boost/shared_ptr.hpp>

#include "plexa/MetaObj.h"

namespace Plexa::CallSpec {

/// The kind of value that a parameter takes. A Bool needs a value (true or false), a Flag takes none; a list is given
/// by repeating the parameter.
enum ParameterType { String = 0, Int = 1, Bool = 2, Flag = 3, StringList = 4, IntList = 5, BoolList = 6 };

/// One declared parameter.
class PLEXA_EXPORT ParameterSpec {
public:
    static boost::shared_ptr<ParameterSpec> New(std::string const &name, ParameterType type);

    // Slot order is part of the binary interface: these three first, the destructor behind them.
    virtual void SetAlias(std::string const &alias);
    virtual void SetDescription(std::string const &description);
    virtual void SetRequired(bool required);
    virtual ~ParameterSpec();

    std::string GetName() const;
    ParameterType GetType() const;
    /// One letter; empty when the parameter has only its long name.
    std::string GetAlias() const;
    std::string GetDescription() const;
    bool IsRequired() const;

protected:
    ParameterSpec(std::string const &name, ParameterType type);

private:
    std::string name_;
    std::string alias_;
    std::string description_;
    ParameterType type_;
    bool required_ = false;
};

/// The parameters of a command, in the order in which help lists them.
class PLEXA_EXPORT InputSpec {
public:
    static boost::shared_ptr<InputSpec> New();
    void AddParameter(boost::shared_ptr<ParameterSpec> const &parameter);
    std::vector<boost::shared_ptr<ParameterSpec>> GetParameters() const;

private:
    std::vector<boost::shared_ptr<ParameterSpec>> parameters_;
};

/// The shape of a command's result: an empty value of the declared type.
class PLEXA_EXPORT OutputSpec {
public:
    static boost::shared_ptr<OutputSpec> New();
    void SetOutputType(boost::shared_ptr<MetaObj::MetaObject> const &type);
    /// Empty when none was set.
    boost::shared_ptr<MetaObj::MetaObject> GetOutputType() const;

private:
    boost::shared_ptr<MetaObj::MetaObject> type_;
};

/// The arguments of one call. A parameter that was not given, or was given as another kind, reads as the empty value
/// of the kind asked for: "", 0, false, an empty list; HasParameter tells it from one that was given empty.
class PLEXA_EXPORT Input {
public:
    static boost::shared_ptr<Input> New();
    Input();
    virtual ~Input();

    virtual bool HasParameter(std::string const &name) const;
    virtual std::string GetString(std::string const &name) const;
    virtual int64_t GetInt(std::string const &name) const;
    virtual bool GetBool(std::string const &name) const;
    virtual std::vector<std::string> GetStringList(std::string const &name) const;
    virtual std::vector<int64_t> GetIntList(std::string const &name) const;
    virtual std::vector<bool> GetBoolList(std::string const &name) const;

    // For the parser and for tests. Setting a parameter again replaces its value.
    void SetString(std::string const &name, std::string const &value);
    void SetInt(std::string const &name, int64_t value);
    void SetBool(std::string const &name, bool value);
    /// Makes both HasParameter and GetBool true.
    void SetFlag(std::string const &name);
    void SetStringList(std::string const &name, std::vector<std::string> const &value);
    void SetIntList(std::string const &name, std::vector<int64_t> const &value);
    void SetBoolList(std::string const &name, std::vector<bool> const &value);

private:
    struct Value {
        ParameterType type = String;
        std::string text;
        int64_t number = 0;
        bool truth = false;
        std::vector<std::string> texts;
        std::vector<int64_t> numbers;
        std::vector<bool> truths;
    };
    Value const *Find(std::string const &name, ParameterType type) const;

    std::map<std::string, Value, std::less<>> values_;
};

/// Where a call leaves what it has to say. A completed output without a message is a success.
class PLEXA_EXPORT Output {
public:
    static boost::shared_ptr<Output> New();
    Output();

    // Slot order is part of the binary interface: these three first, the destructor behind them.
    /// A text for the user, as it is to be shown, line ends included. Set again, it replaces the earlier one.
    virtual void SetMessage(std::string const &text);
    virtual void SetResult(boost::shared_ptr<MetaObj::MetaObject> const &result);
    virtual void Complete();
    virtual ~Output();

    bool HasMessage() const;
    std::string GetMessage() const;
    /// Empty when none was set.
    boost::shared_ptr<MetaObj::MetaObject> GetResult() const;
    bool IsComplete() const;

private:
    bool hasMessage_ = false;
    bool complete_ = false;
    std::string message_;
    boost::shared_ptr<MetaObj::MetaObject> result_;
};

/// Something that can be called. Not deleted through this type.
class PLEXA_EXPORT CallTarget {
public:
    virtual boost::shared_ptr<InputSpec> GetInputSpec() = 0;
    virtual boost::shared_ptr<OutputSpec> GetOutputSpec() = 0;
    virtual void Execute(boost::shared_ptr<Input> const &input, boost::shared_ptr<Output> const &output) = 0;

protected:
    ~CallTarget() = default;
};

} // namespace Plexa::CallSpec

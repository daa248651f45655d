// SPDX-License-Identifier: Apache-2.0
//
// Typed values: what a command's schema declares and what its result holds.
//
// A command builds the same kind of object twice: once empty, as the schema that help and formatters read, and once
// filled, as the result of a call. A scalar therefore knows whether it was set. Formatters leave a field that is not
// set out, or print it empty or null; they never invent a default. Values are handed around by boost::shared_ptr and
// are not synchronised: one thread at a time.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include <boost/shared_ptr.hpp>

// Everything is built with hidden visibility; what libplexa offers across its boundary carries this mark.
#define PLEXA_EXPORT __attribute__((visibility("default")))

namespace Plexa::MetaObj {

/// What the elements of a list are. Commands use StringList and StructList only.
enum MetaType { Int = 0, Bool = 1, StringList = 2, StructList = 3 };

/// Base of every value.
class PLEXA_EXPORT MetaObject {
public:
    virtual ~MetaObject();
    /// False for a scalar that only declares a type; a list and a structure are always set.
    virtual bool IsSet() const;

protected:
    MetaObject() = default;
    MetaObject(MetaObject const &) = default;
    MetaObject &operator=(MetaObject const &) = default;
};

/// A boolean, or the declaration of one. GetValue of an empty one is false.
class PLEXA_EXPORT MetaBool : public MetaObject {
public:
    static boost::shared_ptr<MetaBool> New();
    static boost::shared_ptr<MetaBool> New(bool value);
    ~MetaBool() override;
    bool IsSet() const override;
    bool GetValue() const;

private:
    friend class MetaStruct;

    bool set_ = false;
    bool value_ = false;
};

/// A signed 64-bit integer, or the declaration of one. GetValue of an empty one is 0.
class PLEXA_EXPORT MetaInt : public MetaObject {
public:
    static boost::shared_ptr<MetaInt> New();
    static boost::shared_ptr<MetaInt> New(int64_t value);
    ~MetaInt() override;
    bool IsSet() const override;
    int64_t GetValue() const;

private:
    friend class MetaStruct;

    bool set_ = false;
    int64_t value_ = 0;
};

/// A text, or the declaration of one. GetValue of an empty one is "". One of more than 4 GiB is a std::length_error.
class PLEXA_EXPORT MetaString : public MetaObject {
public:
    static boost::shared_ptr<MetaString> New();
    static boost::shared_ptr<MetaString> New(std::string const &value);
    MetaString() = default;
    MetaString(MetaString const &other);
    MetaString(MetaString &&other) noexcept;
    MetaString &operator=(MetaString const &other);
    ~MetaString() override;
    bool IsSet() const override;
    std::string GetValue() const;
    /// The same without a copy; valid as long as this object.
    std::string_view ViewValue() const {
        return {text_, size_};
    }

private:
    friend class MetaStruct;
    friend class RowStore;

    void Assign(std::string_view value);

    char const *text_ = "";
    uint32_t size_ = 0;
    bool set_ = false;
    bool ownsText_ = false; // else the text is somebody's who outlives this
};

class RowStore;

/// An ordered list. The element schema tells formatters and help what an element looks like when there is none yet.
/// Structures that are appended come to lie close together: a list of them may be long (see MetaStruct).
class PLEXA_EXPORT MetaList : public MetaObject {
public:
    static boost::shared_ptr<MetaList> New(MetaType type);
    static boost::shared_ptr<MetaList> New(MetaType type, boost::shared_ptr<MetaObject> const &elementSchema);
    ~MetaList() override;
    MetaType GetType() const;
    /// Empty when the list was made without one.
    boost::shared_ptr<MetaObject> GetElementSchema() const;
    void Append(boost::shared_ptr<MetaObject> const &element);
    std::vector<boost::shared_ptr<MetaObject>> GetElements() const;
    /// The same without a copy; valid until an element is appended.
    std::vector<boost::shared_ptr<MetaObject>> const &ViewElements() const;

private:
    MetaType type_ = StringList;
    boost::shared_ptr<MetaObject> elementSchema_;
    std::vector<boost::shared_ptr<MetaObject>> elements_;
    boost::shared_ptr<RowStore> rows_; // none before the first structure
};

/// A structure: named fields in declared order. A field set again replaces its value and keeps its place.
///
/// Texts, numbers and truths that are given as such lie in the structure itself and become objects only when somebody
/// asks for one by GetField. In a list, structures that are alike share their names, and their values lie one behind
/// the other, until one of them is changed or asked.
class PLEXA_EXPORT MetaStruct : public MetaObject {
    /// What a value is held as.
    enum class Held : unsigned char { Text, Number, Truth, Object };
    struct Column {
        std::string name;
        Held held;
    };
    union Cell {
        // NOLINTBEGIN(modernize-use-equals-default): that would delete them, as the members have their own
        Cell() {}
        Cell(Cell const &) = delete;
        Cell &operator=(Cell const &) = delete;
        ~Cell() {}
        // NOLINTEND(modernize-use-equals-default)
        MetaString text;
        MetaInt number;
        MetaBool truth;
        boost::shared_ptr<MetaObject> object;
    };

public:
    /// Names and values in declared order, looked at in place.
    class Fields {
    public:
        std::size_t size() const {
            return count_;
        }
        std::string const &name(std::size_t place) const {
            return columns_[place].name;
        }
        /// Null where an empty pointer was set.
        MetaObject const *value(std::size_t place) const {
            Cell const &cell = cells_[place];
            switch (columns_[place].held) {
            case Held::Text:
                return &cell.text;
            case Held::Number:
                return &cell.number;
            case Held::Truth:
                return &cell.truth;
            default:
                return cell.object.get();
            }
        }
        /// Whether both look at the same names, surely; they may be alike even so.
        bool sharesNames(void const *names) const {
            return columns_ == names;
        }
        /// For sharesNames. Lasts as long as the structure is as it is.
        void const *names() const {
            return columns_;
        }

    private:
        friend class MetaStruct;

        Column const *columns_ = nullptr;
        Cell const *cells_ = nullptr;
        std::size_t count_ = 0;
    };

    static boost::shared_ptr<MetaStruct> New(std::string const &name);
    MetaStruct() = default;
    MetaStruct(MetaStruct const &other);
    MetaStruct &operator=(MetaStruct const &) = delete;
    ~MetaStruct() override;

    void SetField(std::string const &field, boost::shared_ptr<MetaBool> const &value);
    void SetField(std::string const &field, boost::shared_ptr<MetaInt> const &value);
    void SetField(std::string const &field, boost::shared_ptr<MetaList> const &value);
    void SetField(std::string const &field, boost::shared_ptr<MetaString> const &value);
    /// The text is copied; a null pointer is taken as "".
    void SetField(std::string const &field, char const *value);
    void SetField(std::string const &field, int64_t value);
    void SetField(std::string const &field, std::string const &value);
    /// Becomes a MetaList of type StringList whose elements are MetaStrings.
    void SetField(std::string const &field, std::vector<std::string> const &value);
    /// These two keep `true` and a literal 0 from picking a pointer overload.
    void SetField(std::string const &field, bool value);
    void SetField(std::string const &field, int value);

    std::string GetName() const;
    std::vector<std::string> GetFieldNames() const;
    /// Empty when the structure has no such field.
    boost::shared_ptr<MetaObject> GetField(std::string const &field) const;
    /// Valid until a field is set or asked for, or this is appended to a list.
    Fields ViewFields() const;

private:
    friend class MetaList;
    friend class RowStore;

    struct Loose;
    struct Packed;

    Loose &Loosened() const;
    Loose *TakenLoose();
    Cell &Emptied(std::string const &field, Held next);
    void StoreText(std::string const &field, std::string_view value);
    void StoreObject(std::string const &field, boost::shared_ptr<MetaObject> value);
    std::string const &ViewName() const;

    // One of them, or neither in a structure without name and fields. Asking for a value may change which.
    mutable Loose *loose_ = nullptr;
    mutable Packed *packed_ = nullptr;
};

} // namespace Plexa::MetaObj

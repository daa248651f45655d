// SPDX-License-Identifier: Apache-2.0
#include "plexa/MetaObj.h"

#include <algorithm>
#include <cstring>
#include <memory>
#include <new>
#include <utility>

#include <boost/make_shared.hpp>

#include "RowStore.h"

namespace Plexa::MetaObj {

MetaStruct::Loose::~Loose() {
    for (std::size_t i = 0; i < count; ++i) {
        destroy(cells[i], columns[i].held);
    }
    drop(columns);
}

void MetaStruct::Loose::drop(Column *block) {
    std::destroy_n(block, count);
    if (block != reinterpret_cast<Column *>(firstColumns)) {
        ::operator delete(block);
    }
}

char *MetaStruct::Loose::roomFor(std::size_t bytes) {
    if (bytes > firstTextBytes - textBytes) {
        return nullptr;
    }
    char *const room = firstTexts + textBytes;
    textBytes += bytes;
    return room;
}

void MetaStruct::Loose::move(Cell &to, Cell &from, Held held) {
    switch (held) {
    case Held::Text:
        new (&to.text) MetaString(std::move(from.text));
        break;
    case Held::Number:
        new (&to.number) MetaInt(from.number);
        break;
    case Held::Truth:
        new (&to.truth) MetaBool(from.truth);
        break;
    case Held::Object:
        new (&to.object) boost::shared_ptr<MetaObject>(std::move(from.object));
    }
}

void MetaStruct::Loose::destroy(Cell &cell, Held held) {
    if (held == Held::Text) {
        cell.text.MetaString::~MetaString(); // its own: no look into the virtual table
    } else if (held == Held::Object) {
        cell.object.reset();
    }
}

std::size_t MetaStruct::Loose::find(std::string const &field) const {
    std::size_t place = 0;
    while (place < count && columns[place].name != field) {
        ++place;
    }
    return place;
}

void MetaStruct::Loose::grow(std::size_t fields) {
    static_assert(sizeof(Column) % alignof(Cell) == 0);
    void *const room = ::operator new(fields *(sizeof(Column) + sizeof(Cell)));
    auto *const newColumns = static_cast<Column *>(room);
    auto *const newCells = reinterpret_cast<Cell *>(newColumns + fields);
    std::uninitialized_move_n(columns, count, newColumns);
    for (std::size_t i = 0; i < count; ++i) {
        move(newCells[i], cells[i], columns[i].held);
    }
    drop(columns);
    columns = newColumns;
    cells = newCells;
    capacity = fields;
}

void MetaStruct::Packed::leave() {
    if (block->shape->holdsObjects) {
        std::vector<Column> const &columns = block->shape->columns;
        for (std::size_t i = 0; i < columns.size(); ++i) {
            Loose::destroy(cells()[i], columns[i].held);
        }
    }
    block->release();
}

boost::shared_ptr<MetaStruct> MetaStruct::New(std::string const &name) {
    auto made = boost::make_shared<MetaStruct>();
    made->loose_ = new Loose(name);
    return made;
}

MetaStruct::MetaStruct(MetaStruct const &other)
    : MetaObject(other) {
    auto copy = std::make_unique<Loose>(other.ViewName());
    Fields const fields = other.ViewFields();
    if (fields.size() > copy->capacity) {
        copy->grow(fields.size());
    }
    for (; copy->count < fields.size(); ++copy->count) {
        std::size_t const i = copy->count;
        Held const held = fields.columns_[i].held;
        new (copy->columns + i) Column(fields.columns_[i]);
        Cell *const to = new (copy->cells + i) Cell;
        switch (held) {
        case Held::Text:
            new (&to->text) MetaString(fields.cells_[i].text);
            break;
        case Held::Number:
            new (&to->number) MetaInt(fields.cells_[i].number);
            break;
        case Held::Truth:
            new (&to->truth) MetaBool(fields.cells_[i].truth);
            break;
        case Held::Object:
            new (&to->object) boost::shared_ptr<MetaObject>(fields.cells_[i].object);
        }
    }
    loose_ = copy.release();
}

MetaStruct::~MetaStruct() {
    if (packed_ != nullptr) {
        packed_->leave();
    }
    delete loose_;
}

void MetaStruct::SetField(std::string const &field, boost::shared_ptr<MetaBool> const &value) {
    StoreObject(field, value);
}

void MetaStruct::SetField(std::string const &field, boost::shared_ptr<MetaInt> const &value) {
    StoreObject(field, value);
}

void MetaStruct::SetField(std::string const &field, boost::shared_ptr<MetaList> const &value) {
    StoreObject(field, value);
}

void MetaStruct::SetField(std::string const &field, boost::shared_ptr<MetaString> const &value) {
    StoreObject(field, value);
}

void MetaStruct::SetField(std::string const &field, char const *value) {
    StoreText(field, value == nullptr ? "" : value);
}

void MetaStruct::SetField(std::string const &field, int64_t value) {
    MetaInt &number = *new (&Emptied(field, Held::Number).number) MetaInt;
    number.set_ = true;
    number.value_ = value;
}

void MetaStruct::SetField(std::string const &field, std::string const &value) {
    StoreText(field, value);
}

void MetaStruct::SetField(std::string const &field, std::vector<std::string> const &value) {
    auto list = MetaList::New(StringList);
    for (std::string const &text : value) {
        list->Append(MetaString::New(text));
    }
    StoreObject(field, std::move(list));
}

void MetaStruct::SetField(std::string const &field, bool value) {
    MetaBool &truth = *new (&Emptied(field, Held::Truth).truth) MetaBool;
    truth.set_ = true;
    truth.value_ = value;
}

void MetaStruct::SetField(std::string const &field, int value) {
    SetField(field, int64_t{value});
}

std::string MetaStruct::GetName() const {
    return ViewName();
}

std::vector<std::string> MetaStruct::GetFieldNames() const {
    Fields const fields = ViewFields();
    std::vector<std::string> names;
    names.reserve(fields.size());
    for (std::size_t i = 0; i < fields.size(); ++i) {
        names.push_back(fields.name(i));
    }
    return names;
}

boost::shared_ptr<MetaObject> MetaStruct::GetField(std::string const &field) const {
    Fields const fields = ViewFields();
    std::size_t place = 0;
    while (place < fields.size() && fields.name(place) != field) {
        ++place;
    }
    if (place == fields.size()) {
        return {};
    }
    if (fields.columns_[place].held == Held::Object) {
        return fields.cells_[place].object;
    }
    // From now on an object of its own, the same for whoever asks again.
    Loose &loose = Loosened();
    Cell &cell = loose.cells[place];
    Held &held = loose.columns[place].held;
    boost::shared_ptr<MetaObject> made;
    if (held == Held::Text) {
        made = boost::make_shared<MetaString>(cell.text); // whose text may lie in here
    } else if (held == Held::Number) {
        made = boost::make_shared<MetaInt>(cell.number);
    } else {
        made = boost::make_shared<MetaBool>(cell.truth);
    }
    Loose::destroy(cell, held);
    new (&cell.object) boost::shared_ptr<MetaObject>(made);
    held = Held::Object;
    return made;
}

MetaStruct::Fields MetaStruct::ViewFields() const {
    Fields fields;
    if (packed_ != nullptr) {
        RowStore::Shape const &shape = *packed_->block->shape;
        fields.columns_ = shape.columns.data();
        fields.cells_ = packed_->cells();
        fields.count_ = shape.columns.size();
    } else if (loose_ != nullptr) {
        fields.columns_ = loose_->columns;
        fields.cells_ = loose_->cells;
        fields.count_ = loose_->count;
    }
    return fields;
}

std::string const &MetaStruct::ViewName() const {
    static std::string const none;
    return packed_ != nullptr ? packed_->block->shape->name : loose_ != nullptr ? loose_->name : none;
}

/// On its own again, if it was not.
MetaStruct::Loose &MetaStruct::Loosened() const {
    if (loose_ == nullptr) {
        std::unique_ptr<Loose> copy(MetaStruct(*this).TakenLoose());
        if (packed_ != nullptr) {
            std::exchange(packed_, nullptr)->leave();
        }
        loose_ = copy.release();
    }
    return *loose_;
}

MetaStruct::Loose *MetaStruct::TakenLoose() {
    return std::exchange(loose_, nullptr);
}

/// Room for a field's next value, which the caller makes there without failing.
MetaStruct::Cell &MetaStruct::Emptied(std::string const &field, Held next) {
    Loose &loose = Loosened();
    std::size_t const place = loose.find(field);
    if (place < loose.count) {
        Loose::destroy(loose.cells[place], loose.columns[place].held);
        loose.columns[place].held = next;
        return loose.cells[place];
    }
    if (loose.count == loose.capacity) {
        loose.grow(2 * loose.count);
    }
    new (loose.columns + place) Column{field, next};
    ++loose.count;
    return *new (loose.cells + place) Cell;
}

void MetaStruct::StoreText(std::string const &field, std::string_view value) {
    MetaString text;
    char *const room = loose_ != nullptr ? loose_->roomFor(value.size()) : nullptr;
    if (room != nullptr) {
        std::memcpy(room, value.data(), value.size());
        text.text_ = room;
        text.size_ = static_cast<uint32_t>(value.size());
        text.set_ = true;
    } else {
        text.Assign(value); // before the old one goes, of which it may be a part
    }
    new (&Emptied(field, Held::Text).text) MetaString(std::move(text));
}

void MetaStruct::StoreObject(std::string const &field, boost::shared_ptr<MetaObject> value) {
    new (&Emptied(field, Held::Object).object) boost::shared_ptr<MetaObject>(std::move(value));
}

} // namespace Plexa::MetaObj

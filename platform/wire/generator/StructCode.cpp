// SPDX-License-Identifier: Apache-2.0
#include "StructCode.h"

#include <stdexcept>

#include "Names.h"
#include "Types.h"

namespace CompactGenerator {

namespace {

std::string text(std::uint64_t number) {
    return std::to_string(number);
}

/// Everything about one field; each accessor is declared in its class and defined after all classes.
class FieldCode {
public:
    FieldCode(std::string structName, capnp::StructSchema::Field field, std::uint32_t discriminantOffset)
        : structName_(std::move(structName))
        , name_(capitalized(field.getProto().getName().cStr()))
        , enumerator_(enumerator(field.getProto().getName().cStr()))
        , inUnion_(field.getProto().getDiscriminantValue() != capnp::schema::Field::NO_DISCRIMINANT)
        , discriminantOffset_(discriminantOffset) {
        if (!field.getProto().isSlot()) {
            throw std::runtime_error("groups are not supported");
        }
        auto const slot = field.getProto().getSlot();
        place_ = text(slot.getOffset());
        type_ = fieldType(field.getType());
        if (type_.kind < FieldType::Text) {
            default_ = defaultOf(slot.getDefaultValue());
        } else if (slot.getHadExplicitDefault()) {
            throw std::runtime_error("defaults of such a type are not supported");
        }
        read();
        write();
    }

    std::string readerDeclarations;
    std::string builderDeclarations;
    std::string functions;

private:
    void readerFunction(std::string const &result, std::string const &name, std::string const &body, bool guarded) {
        readerDeclarations += "    " + result + " " + name + "() const;\n";
        std::string const guard = inUnion_ && guarded ? "    assert(is" + name_ + "());\n" : "";
        functions += "inline " + result + " " + structName_ + "::Reader::" + name + "() const {\n" + guard +
                     "    return " + body + ";\n}\n";
    }

    void builderFunction(std::string const &result, std::string const &signature, std::string const &body) {
        builderDeclarations += "    " + result + " " + signature + ";\n";
        std::string const discriminant =
            inUnion_ ? "    setNumber<std::uint16_t>(" + text(discriminantOffset_) + ", " + enumerator_ + ");\n" : "";
        functions += "inline " + result + " " + structName_ + "::Builder::" + signature + " {\n" + discriminant +
                     (body.empty() ? "" : "    " + body + ";\n") + "}\n";
    }

    void read() {
        if (inUnion_) {
            readerFunction("bool", "is" + name_, "which() == " + enumerator_, false);
        }
        std::string const get = "get" + name_;
        switch (type_.kind) {
        case FieldType::Void:
            return;
        case FieldType::Bool:
            return readerFunction("bool", get, std::string(default_.empty() ? "" : "!") + "bit(" + place_ + ")", true);
        case FieldType::Number: {
            std::string const stored = "number<" + type_.name + ">(" + place_ + ")";
            return readerFunction(
                type_.name, get,
                default_.empty() ? stored : "static_cast<" + type_.name + ">(" + stored + " ^ " + default_ + ")", true);
        }
        case FieldType::Text:
            readerFunction("std::string_view", get, "text(" + place_ + ")", true);
            break;
        case FieldType::Data:
            readerFunction("std::span<std::uint8_t const>", get, "data(" + place_ + ")", true);
            break;
        case FieldType::Struct:
            readerFunction(type_.name + "::Reader", get, "structure<" + type_.name + "::Reader>(" + place_ + ")", true);
            break;
        case FieldType::List:
            readerFunction("List<" + type_.name + ">::Reader", get,
                           "list<List<" + type_.name + ">::Reader>(" + place_ + ")", true);
            break;
        }
        readerFunction("bool", "has" + name_,
                       (inUnion_ ? "is" + name_ + "() && " : std::string()) + "hasPointer(" + place_ + ")", false);
    }

    void write() {
        std::string const set = "set" + name_;
        std::string const init = "init" + name_;
        switch (type_.kind) {
        case FieldType::Void:
            return builderFunction("void", set + "()", "");
        case FieldType::Bool:
            return builderFunction("void", set + "(bool value)",
                                   "setBit(" + place_ + ", " + (default_.empty() ? "" : "!") + "value)");
        case FieldType::Number:
            return builderFunction(
                "void", set + "(" + type_.name + " value)",
                "setNumber<" + type_.name + ">(" + place_ + ", " +
                    (default_.empty() ? "value" : "static_cast<" + type_.name + ">(value ^ " + default_ + ")") + ")");
        case FieldType::Text:
            return builderFunction("void", set + "(std::string_view value)",
                                   "StructBuilder::setText(" + place_ + ", value)");
        case FieldType::Data:
            return builderFunction("void", set + "(std::span<std::uint8_t const> value)",
                                   "StructBuilder::setData(" + place_ + ", value)");
        case FieldType::Struct:
            return builderFunction(type_.name + "::Builder", init + "()",
                                   "return initStruct<" + type_.name + ">(" + place_ + ")");
        case FieldType::List:
            return builderFunction("List<" + type_.name + ">::Builder", init + "(std::size_t count)",
                                   "return initList<List<" + type_.name + ">::Builder>(" + place_ + ", count)");
        }
    }

    std::string const structName_;
    std::string const name_;
    std::string const enumerator_;
    bool const inUnion_;
    std::uint32_t const discriminantOffset_;
    std::string place_;
    std::string default_;
    FieldType type_;
};

std::string classCode(std::string const &structName, std::string const &kind, std::string const &parameter,
                      std::string const &declarations) {
    return "class " + structName + "::" + kind + " : public Struct" + kind +
           " {\npublic:\n"
           "    explicit " +
           kind + "(" + parameter + " place)\n        : Struct" + kind + "(place) {}\n" + declarations + "};\n\n";
}

std::string shellCode(capnp::StructSchema schema, std::string const &name, std::string const &nested,
                      std::string const &indent) {
    auto const node = schema.getProto().getStruct();
    std::string code = indent + "struct " + ownName(name) + " {\n";
    code += indent + "    class Reader;\n" + indent + "    class Builder;\n";
    code += indent + "    static constexpr StructSize size{" + text(node.getDataWordCount()) + ", " +
            text(node.getPointerCount()) + "};\n";
    if (node.getDiscriminantCount() > 0) {
        code += indent + "    enum Which : std::uint16_t {\n";
        for (auto const field : schema.getUnionFields()) {
            code += indent + "        " + enumerator(field.getProto().getName().cStr()) + " = " +
                    text(field.getProto().getDiscriminantValue()) + ",\n";
        }
        code += indent + "    };\n";
    }
    return code + nested + indent + "};\n";
}

} // namespace

StructCode structCode(capnp::StructSchema schema, capnp::SchemaLoader const &loader, std::string const &indent) {
    std::string const name = scopedName(schema.getProto().getDisplayName().cStr());
    auto const node = schema.getProto().getStruct();
    StructCode code;
    std::string nested;
    for (auto const inner : schema.getProto().getNestedNodes()) {
        capnp::Schema const innerSchema = loader.get(inner.getId());
        if (innerSchema.getProto().isStruct()) {
            StructCode const innerCode = structCode(innerSchema.asStruct(), loader, indent + "    ");
            nested += innerCode.shell;
            code.classes += innerCode.classes;
            code.functions += innerCode.functions;
        }
    }
    std::string readers = "    Reader() = default;\n";
    std::string builders;
    if (node.getDiscriminantCount() > 0) {
        std::string const which =
            "    Which which() const {\n        return static_cast<Which>(number<std::uint16_t>(" +
            text(node.getDiscriminantOffset()) + "));\n    }\n";
        readers += which;
        builders += which;
    }
    for (auto const field : schema.getFields()) {
        try {
            FieldCode const fieldCode(name, field, node.getDiscriminantOffset());
            readers += fieldCode.readerDeclarations;
            builders += fieldCode.builderDeclarations;
            code.functions += fieldCode.functions;
        } catch (std::runtime_error const &error) {
            throw std::runtime_error(name + "." + field.getProto().getName().cStr() + ": " + error.what());
        }
    }
    code.shell = shellCode(schema, name, nested, indent);
    code.classes += classCode(name, "Reader", "StructReader const &", readers);
    code.classes += classCode(name, "Builder", "StructBuilder const &", builders);
    return code;
}

} // namespace CompactGenerator

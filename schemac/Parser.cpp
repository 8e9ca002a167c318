#include "schemac/Parser.h"

#include "schemac/Lexer.h"
#include "schemac/Types.h"

#include <charconv>

namespace schemac
{

namespace
{

class Parser
{
public:
    Parser(std::string_view text, const std::string& file, Schema& schema) : _lexer(text, file), _schema(schema)
    {
        advance();
    }

    void file()
    {
        while (_token.kind != Token::Kind::End)
            if (at_word("Qualifier"))
                _schema.qualifiers.push_back(qualifier_declaration());
            else
                _schema.classes.push_back(class_declaration());
    }

private:
    // --- tokens ---

    void advance() { _token = _lexer.next(); }

    Place here() const { return {_lexer.file(), _token.line}; }

    [[noreturn]] void refuse_expected(const std::string& what) const
    {
        const std::string found = _token.kind == Token::Kind::End ? "the end of the file" : "\"" + _token.text + "\"";
        throw SyntaxError(here(), "expected " + what + ", found " + found);
    }

    bool at_mark(char mark) const { return _token.kind == Token::Kind::Mark && _token.text[0] == mark; }
    bool at_word(const char* word) const { return _token.kind == Token::Kind::Name && same_name(_token.text, word); }

    bool accept(char mark)
    {
        const bool there = at_mark(mark);
        if (there)
            advance();
        return there;
    }

    void expect(char mark)
    {
        if (!accept(mark))
            refuse_expected(std::string("\"") + mark + "\"");
    }

    bool accept_word(const char* word)
    {
        const bool there = at_word(word);
        if (there)
            advance();
        return there;
    }

    void expect_word(const char* word)
    {
        if (!accept_word(word))
            refuse_expected(std::string("\"") + word + "\"");
    }

    std::string name(const char* what)
    {
        if (_token.kind != Token::Kind::Name)
            refuse_expected(what);
        std::string text = std::move(_token.text);
        advance();
        return text;
    }

    // --- values ---

    Literal literal()
    {
        Literal result{Literal::Kind::Null, _token.text};
        switch (_token.kind)
        {
        case Token::Kind::Integer:
            result.kind = Literal::Kind::Integer;
            break;
        case Token::Kind::Real:
            result.kind = Literal::Kind::Real;
            break;
        case Token::Kind::String:
            return string_literal();
        default:
            if (at_word("true") || at_word("false"))
                result = {Literal::Kind::Boolean, at_word("true") ? "true" : "false"};
            else if (!at_word("null"))
                refuse_expected("a value");
        }
        advance();
        return result;
    }

    /// Strings that stand side by side are one.
    Literal string_literal()
    {
        Literal result{Literal::Kind::String, ""};
        while (_token.kind == Token::Kind::String)
        {
            result.text += _token.text;
            advance();
        }
        return result;
    }

    /// The items of a list up to its closing brace.
    Value list()
    {
        Value value;
        value.is_array = true;
        if (!accept('}'))
        {
            do
            {
                value.items.push_back(literal());
            } while (accept(','));
            expect('}');
        }
        return value;
    }

    Value value() { return accept('{') ? list() : Value{false, {literal()}}; }

    // --- qualifiers ---

    Qualifiers qualifiers()
    {
        Qualifiers result;
        if (accept('['))
        {
            do
            {
                result.push_back(qualifier());
            } while (accept(','));
            expect(']');
        }
        return result;
    }

    Qualifier qualifier()
    {
        Qualifier result;
        result.place = here();
        result.name = name("a qualifier");
        if (accept('('))
        {
            result.value = Value{false, {literal()}};
            expect(')');
        }
        else if (accept('{'))
        {
            result.value = list();
        }
        return result;
    }

    std::vector<std::string> names_in_parentheses()
    {
        std::vector<std::string> names;
        expect('(');
        do
        {
            names.push_back(name("a name"));
        } while (accept(','));
        expect(')');
        return names;
    }

    QualifierDeclaration qualifier_declaration()
    {
        QualifierDeclaration result;
        result.place = here();
        expect_word("Qualifier");
        result.name = name("the name of a qualifier");
        expect(':');
        result.type = name("a type");
        if (accept('['))
        {
            expect(']');
            result.is_array = true;
        }
        if (accept('='))
            result.default_value = value();
        expect(',');
        expect_word("Scope");
        result.scopes = names_in_parentheses();
        if (accept(','))
        {
            expect_word("Flavor");
            result.flavors = names_in_parentheses();
        }
        expect(';');
        return result;
    }

    // --- classes ---

    Class class_declaration()
    {
        Class result;
        result.qualifiers = qualifiers();
        result.place = here();
        expect_word("class");
        result.name = name("the name of a class");
        if (accept(':'))
            result.superclass_name = name("the name of a superclass");
        expect('{');
        while (!accept('}'))
            result.features.push_back(feature());
        expect(';');
        return result;
    }

    Feature feature()
    {
        Feature result = typed_name();
        if (accept('('))
        {
            make_method(result);
        }
        else
        {
            result.subscript = subscript();
            if (accept('='))
                result.default_value = value();
            classify(result);
        }
        expect(';');
        return result;
    }

    /// Qualifiers, type and name: what features and parameters begin with.
    Feature typed_name()
    {
        Feature result;
        result.qualifiers = qualifiers();
        result.place = here();
        std::string type = name("a type");
        if (accept_word("REF"))
        {
            result.kind = FeatureKind::Reference;
            result.class_name = std::move(type);
        }
        else
        {
            result.type = std::move(type);
        }
        result.name = name("a name");
        return result;
    }

    void make_method(Feature& method)
    {
        if (method.kind == FeatureKind::Reference)
            throw SyntaxError(method.place, "method \"" + method.name + "\" returns a reference");
        method.kind = FeatureKind::Method;
        if (accept(')'))
            return;
        do
        {
            Feature parameter = typed_name();
            parameter.subscript = subscript();
            classify(parameter);
            method.parameters.push_back(std::move(parameter));
        } while (accept(','));
        expect(')');
    }

    int subscript()
    {
        if (!accept('['))
            return 0;
        int size = -1;
        if (_token.kind == Token::Kind::Integer)
        {
            const char* end = _token.text.data() + _token.text.size();
            const auto parsed = std::from_chars(_token.text.data(), end, size);
            if (parsed.ec != std::errc() || parsed.ptr != end || size < 1 || size > max_subscript)
                refuse_expected("the size of an array");
            advance();
        }
        expect(']');
        return size;
    }

    /// A string with one of the two embedding qualifiers is a reference.
    static void classify(Feature& feature)
    {
        const std::string* embedded_class = text_of(feature.qualifiers, "EmbeddedInstance");
        if (embedded_class)
        {
            feature.embedded = Embedded::Instance;
            feature.class_name = *embedded_class;
        }
        else if (is_set(feature.qualifiers, "EmbeddedObject"))
        {
            feature.embedded = Embedded::Object;
        }
        if (feature.embedded != Embedded::No)
            feature.kind = FeatureKind::Reference;
    }

    Lexer _lexer;
    Schema& _schema;
    Token _token;
};

} // namespace

void parse(std::string_view text, const std::string& file, Schema& schema)
{
    Parser(text, file, schema).file();
}

} // namespace schemac

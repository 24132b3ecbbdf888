// A reader for the MOF that class files and provider registrations are
// written in: pragmas, qualifier declarations, classes with properties,
// references and methods, and instances with literal values.
#include "Mof.h"
#include "MofLexer.h"

#include <algorithm>
#include <array>
#include <cctype>
#include <fstream>
#include <sstream>

namespace mof
{

namespace
{

using detail::describe;
using detail::Token;

constexpr std::array<std::string_view, 14> dataTypes = {
    "uint8",  "sint8",  "uint16", "sint16", "uint32", "sint32",  "uint64",
    "sint64", "real32", "real64", "char16", "string", "boolean", "datetime"};

std::string lowerCase(std::string_view text)
{
    std::string out(text);
    std::transform(out.begin(), out.end(), out.begin(),
                   [](unsigned char c)
                   { return static_cast<char>(std::tolower(c)); });
    return out;
}

bool isDataType(std::string_view name)
{
    const std::string lower = lowerCase(name);
    return std::find(dataTypes.begin(), dataTypes.end(), lower) !=
           dataTypes.end();
}

class Parser
{
  public:
    Parser(std::vector<Token> tokens, const std::string& source) :
        tokens_(std::move(tokens)), source_(source)
    {
    }

    Document document()
    {
        Document doc;
        while (current().kind != Token::Kind::End)
        {
            if (isPunctuation("#"))
            {
                doc.pragmas.push_back(pragma());
                continue;
            }
            if (isKeyword("qualifier"))
            {
                doc.qualifiers.push_back(qualifierDeclaration());
                continue;
            }
            const int line = current().line;
            std::vector<Qualifier> qualifiers;
            if (isPunctuation("["))
            {
                qualifiers = qualifierList();
            }
            if (isKeyword("class"))
            {
                Class c = classDeclaration(std::move(qualifiers));
                c.line = line;
                doc.classes.push_back(std::move(c));
            }
            else if (isKeyword("instance"))
            {
                Instance i = instanceDeclaration();
                i.line = line;
                doc.instances.push_back(std::move(i));
            }
            else
            {
                fail("expected a class, an instance, a qualifier "
                     "declaration or a pragma, found " +
                     describe(current()));
            }
        }
        return doc;
    }

  private:
    [[noreturn]] void fail(const std::string& what) const
    {
        throw MofError(source_ + ":" + std::to_string(current().line) + ": " +
                       what);
    }

    const Token& current() const
    {
        return tokens_[at_];
    }

    Token take()
    {
        Token token = tokens_[at_];
        if (at_ + 1 < tokens_.size())
        {
            ++at_;
        }
        return token;
    }

    bool isPunctuation(std::string_view text) const
    {
        return current().kind == Token::Kind::Punctuation &&
               current().text == text;
    }

    bool isKeyword(std::string_view word) const
    {
        return current().kind == Token::Kind::Identifier &&
               sameName(current().text, word);
    }

    void expect(std::string_view punctuation)
    {
        if (!isPunctuation(punctuation))
        {
            fail("expected '" + std::string(punctuation) + "', found " +
                 describe(current()));
        }
        take();
    }

    void expectKeyword(std::string_view word)
    {
        if (!isKeyword(word))
        {
            fail("expected \"" + std::string(word) + "\", found " +
                 describe(current()));
        }
        take();
    }

    std::string identifier(const char* what)
    {
        if (current().kind != Token::Kind::Identifier)
        {
            fail(std::string("expected ") + what + ", found " +
                 describe(current()));
        }
        return take().text;
    }

    Pragma pragma()
    {
        expect("#");
        expectKeyword("pragma");
        Pragma p;
        p.name = identifier("a pragma name");
        expect("(");
        if (current().kind != Token::Kind::String)
        {
            fail("expected a string, found " + describe(current()));
        }
        p.value = take().text;
        expect(")");
        return p;
    }

    QualifierDeclaration qualifierDeclaration()
    {
        expectKeyword("qualifier");
        QualifierDeclaration d;
        d.name = identifier("a qualifier name");
        expect(":");
        d.type.name = d.name;
        d.type.type = dataType();
        d.type.isArray = arraySuffix();
        if (isPunctuation("="))
        {
            take();
            d.defaultValue = value();
        }
        expect(",");
        expectKeyword("scope");
        d.scopes = identifierList();
        if (isPunctuation(","))
        {
            take();
            expectKeyword("flavor");
            d.flavors = identifierList();
        }
        expect(";");
        return d;
    }

    std::vector<std::string> identifierList()
    {
        std::vector<std::string> names;
        expect("(");
        names.push_back(identifier("a name"));
        while (isPunctuation(","))
        {
            take();
            names.push_back(identifier("a name"));
        }
        expect(")");
        return names;
    }

    std::string dataType()
    {
        const std::string name = identifier("a data type");
        if (!isDataType(name))
        {
            fail("unknown data type \"" + name + "\"");
        }
        return lowerCase(name);
    }

    // "[]" or "[N]" after a name: an array.
    bool arraySuffix()
    {
        if (!isPunctuation("["))
        {
            return false;
        }
        take();
        if (current().kind == Token::Kind::Integer)
        {
            if (current().integer < 0)
            {
                fail("negative array size");
            }
            take();
        }
        expect("]");
        return true;
    }

    std::vector<Qualifier> qualifierList()
    {
        std::vector<Qualifier> qualifiers;
        expect("[");
        for (;;)
        {
            Qualifier q;
            q.name = identifier("a qualifier name");
            if (findQualifier(qualifiers, q.name) != nullptr)
            {
                fail("qualifier \"" + q.name + "\" given twice");
            }
            if (isPunctuation("("))
            {
                take();
                q.value = value();
                expect(")");
            }
            else if (isPunctuation("{"))
            {
                q.value = value();
            }
            else
            {
                q.value.kind = Value::Kind::Boolean;
                q.value.boolean = true;
            }
            if (isPunctuation(":"))
            {
                take();
                identifier("a flavor");
                while (current().kind == Token::Kind::Identifier)
                {
                    take();
                }
            }
            qualifiers.push_back(std::move(q));
            if (isPunctuation("]"))
            {
                take();
                return qualifiers;
            }
            expect(",");
        }
    }

    Class classDeclaration(std::vector<Qualifier> qualifiers)
    {
        expectKeyword("class");
        Class c;
        c.source = source_;
        c.qualifiers = std::move(qualifiers);
        c.name = identifier("a class name");
        if (isPunctuation(":"))
        {
            take();
            c.superclass = identifier("a superclass name");
        }
        expect("{");
        while (!isPunctuation("}"))
        {
            classFeature(c);
        }
        take();
        expect(";");
        return c;
    }

    // A property, reference or method of a class.
    void classFeature(Class& c)
    {
        Feature f;
        f.line = current().line;
        if (isPunctuation("["))
        {
            f.qualifiers = qualifierList();
        }
        typeAndName(f);
        if (isPunctuation("("))
        {
            if (c.method(f.name) != nullptr)
            {
                fail("method \"" + f.name + "\" declared twice");
            }
            Method m;
            m.name = f.name;
            m.returns = std::move(f);
            m.parameters = parameters();
            expect(";");
            c.methods.push_back(std::move(m));
            return;
        }
        if (c.property(f.name) != nullptr)
        {
            fail("property \"" + f.name + "\" declared twice");
        }
        f.isArray = arraySuffix();
        if (isPunctuation("="))
        {
            take();
            f.defaultValue = value();
        }
        expect(";");
        c.properties.push_back(std::move(f));
    }

    // "type name" or "ClassName REF name".
    void typeAndName(Feature& f)
    {
        const std::string first = identifier("a data type or class name");
        if (isKeyword("ref"))
        {
            take();
            f.type = "ref";
            f.referenceClass = first;
        }
        else if (isDataType(first))
        {
            f.type = lowerCase(first);
        }
        else
        {
            fail("unknown data type \"" + first + "\"");
        }
        f.name = identifier("a name");
    }

    std::vector<Feature> parameters()
    {
        std::vector<Feature> list;
        expect("(");
        if (isPunctuation(")"))
        {
            take();
            return list;
        }
        for (;;)
        {
            Feature p;
            p.line = current().line;
            if (isPunctuation("["))
            {
                p.qualifiers = qualifierList();
            }
            typeAndName(p);
            p.isArray = arraySuffix();
            list.push_back(std::move(p));
            if (isPunctuation(")"))
            {
                take();
                return list;
            }
            expect(",");
        }
    }

    Instance instanceDeclaration()
    {
        expectKeyword("instance");
        expectKeyword("of");
        Instance instance;
        instance.source = source_;
        instance.className = identifier("a class name");
        if (isKeyword("as"))
        {
            fail("instance aliases are not supported");
        }
        expect("{");
        while (!isPunctuation("}"))
        {
            if (isPunctuation("["))
            {
                qualifierList();
            }
            std::string name = identifier("a property name");
            if (instance.property(name) != nullptr)
            {
                fail("property \"" + name + "\" given twice");
            }
            expect("=");
            Value v = value();
            expect(";");
            instance.properties.emplace_back(std::move(name), std::move(v));
        }
        take();
        expect(";");
        return instance;
    }

    Value value()
    {
        if (!isPunctuation("{"))
        {
            return literal();
        }
        take();
        Value array;
        array.kind = Value::Kind::Array;
        if (isPunctuation("}"))
        {
            take();
            return array;
        }
        for (;;)
        {
            array.elements.push_back(literal());
            if (isPunctuation("}"))
            {
                take();
                return array;
            }
            expect(",");
        }
    }

    Value literal()
    {
        Value v;
        const Token& t = current();
        switch (t.kind)
        {
            case Token::Kind::String:
                v.kind = Value::Kind::String;
                // Adjacent strings are one string.
                while (current().kind == Token::Kind::String)
                {
                    v.text += take().text;
                }
                return v;
            case Token::Kind::Char:
                v.kind = Value::Kind::Char;
                v.text = take().text;
                return v;
            case Token::Kind::Integer:
                v.kind = Value::Kind::Integer;
                v.integer = take().integer;
                return v;
            case Token::Kind::Real:
                v.kind = Value::Kind::Real;
                v.text = take().text;
                return v;
            case Token::Kind::Identifier:
                if (isKeyword("true") || isKeyword("false"))
                {
                    v.kind = Value::Kind::Boolean;
                    v.boolean = isKeyword("true");
                    take();
                    return v;
                }
                if (isKeyword("null"))
                {
                    take();
                    return v;
                }
                break;
            default:
                break;
        }
        fail("expected a value, found " + describe(t));
    }

    std::vector<Token> tokens_;
    const std::string& source_;
    std::size_t at_ = 0;
};

} // namespace

Document parse(std::string_view text, const std::string& source)
{
    Parser parser(detail::tokenize(text, source), source);
    return parser.document();
}

Document parseFile(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    if (!in)
    {
        throw MofError(path + ": cannot be read");
    }
    std::ostringstream text;
    text << in.rdbuf();
    if (in.bad())
    {
        throw MofError(path + ": cannot be read");
    }
    return parse(text.str(), path);
}

} // namespace mof

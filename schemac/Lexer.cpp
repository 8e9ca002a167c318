#include "schemac/Lexer.h"

#include <cctype>

namespace schemac
{

namespace
{

bool is_name_start(char c)
{
    return std::isalpha(static_cast<unsigned char>(c)) || c == '_';
}

bool is_digit(char c)
{
    return std::isdigit(static_cast<unsigned char>(c));
}

bool is_name_part(char c)
{
    return is_name_start(c) || is_digit(c);
}

} // namespace

char Lexer::take()
{
    const char c = _text[_pos++];
    _line += c == '\n';
    return c;
}

void Lexer::refuse(const std::string& reason) const
{
    throw SyntaxError({_file, _line}, reason);
}

void Lexer::skip_blanks_and_comments()
{
    while (_pos < _text.size())
    {
        if (std::isspace(static_cast<unsigned char>(peek())))
        {
            take();
        }
        else if (peek() == '/' && peek(1) == '/')
        {
            while (_pos < _text.size() && peek() != '\n')
                take();
        }
        else if (peek() == '/' && peek(1) == '*')
        {
            const std::size_t end = _text.find("*/", _pos + 2);
            if (end == std::string_view::npos)
                refuse("comment without end");
            while (_pos < end + 2)
                take();
        }
        else
        {
            return;
        }
    }
}

Token Lexer::string_token()
{
    static constexpr std::string_view escapes = "\"\\'nrtbf";
    static constexpr std::string_view meanings = "\"\\'\n\r\t\b\f";
    Token token{Token::Kind::String, "", _line};
    take();
    while (peek() != '"')
    {
        if (_pos >= _text.size() || peek() == '\n')
            refuse("string without end");
        char c = take();
        if (c == '\\')
        {
            const std::size_t which = escapes.find(peek());
            if (_pos >= _text.size() || which == std::string_view::npos)
                refuse("unknown escape in a string");
            take();
            c = meanings[which];
        }
        token.text += c;
    }
    take();
    return token;
}

/// Decimal or hexadecimal integers, and reals with a point.
Token Lexer::number_token()
{
    Token token{Token::Kind::Integer, "", _line};
    if (peek() == '+' || peek() == '-')
        token.text += take();
    while (is_name_part(peek()) || peek() == '.' ||
           ((peek() == '+' || peek() == '-') && (_text[_pos - 1] == 'e' || _text[_pos - 1] == 'E')))
        token.text += take();
    const bool hexadecimal = token.text.find_first_of("xX") != std::string::npos;
    if (!hexadecimal && token.text.find('.') != std::string::npos)
        token.kind = Token::Kind::Real;
    return token;
}

Token Lexer::next()
{
    skip_blanks_and_comments();
    if (_pos >= _text.size())
        return {Token::Kind::End, "", _line};
    const char c = peek();
    if (c == '"')
        return string_token();
    if (is_digit(c) || ((c == '+' || c == '-') && is_digit(peek(1))))
        return number_token();
    if (is_name_start(c))
    {
        Token token{Token::Kind::Name, "", _line};
        while (is_name_part(peek()))
            token.text += take();
        return token;
    }
    if (std::string_view("{}[]():;,=").find(c) != std::string_view::npos)
        return {Token::Kind::Mark, std::string(1, take()), _line};
    if (c == '#')
        refuse("pragmas are not supported");
    refuse(std::string("unexpected character '") + c + "'");
}

} // namespace schemac

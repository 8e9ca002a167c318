// Splits MOF text into tokens.
#pragma once

#include "schemac/Model.h"

#include <string>
#include <string_view>

namespace schemac
{

struct Token
{
    enum class Kind
    {
        Name,
        String,
        Integer,
        Real,
        Mark, ///< one of { } [ ] ( ) : ; , =
        End,
    };
    Kind kind = Kind::End;
    std::string text; ///< decoded content of a string, otherwise as written
    int line = 0;
};

class Lexer
{
public:
    /// `text` must outlive the lexer; `file` is for refusals.
    Lexer(std::string_view text, std::string file) : _text(text), _file(std::move(file)) {}

    /// The next token, End for ever after the last. Throws SyntaxError.
    Token next();

    const std::string& file() const { return _file; }

private:
    char peek(std::size_t ahead = 0) const { return _pos + ahead < _text.size() ? _text[_pos + ahead] : '\0'; }
    char take();
    [[noreturn]] void refuse(const std::string& reason) const;
    void skip_blanks_and_comments();
    Token string_token();
    Token number_token();

    std::string_view _text;
    std::string _file;
    std::size_t _pos = 0;
    int _line = 1;
};

} // namespace schemac

// What the package format counts as whitespace between and inside tags.
#pragma once

// Exactly these four: form feed, vertical tab and NUL are not whitespace here.
constexpr bool IsWhiteSpaceChar(char c) { return c == '\r' || c == '\n' || c == '\t' || c == ' '; }

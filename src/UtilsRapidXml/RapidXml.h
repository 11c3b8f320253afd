#pragma once

// The one door to RapidXml, for narrow and for wide text. Nothing else includes its headers: the
// specialisations below have to be seen before the first use of the wide parser in every source.

#include <iterator> // the printer uses it without including it everywhere

#include <rapidxml/rapidxml.hpp>
#include <rapidxml/rapidxml_print.hpp>

namespace rapidxml {

// RapidXml asks tables of 256 entries what a character is, and finds the entry by the low byte of
// the character. For wide text that is wrong above 0xFF: U+013C passes for "<", so that the parser
// waits without end for an element that never comes and allocates all the while, and U+0420 passes
// for a blank. Here every unit above 0xFF is an ordinary character: part of a name, a text or a
// value, and never white space. Up to 0xFF the answers are those of the tables.

template <>
inline unsigned char xml_document<wchar_t>::whitespace_pred::test(wchar_t ch)
{
    return ch == L' ' || ch == L'\t' || ch == L'\n' || ch == L'\r';
}

template <>
inline unsigned char xml_document<wchar_t>::node_name_pred::test(wchar_t ch)
{
    return static_cast<unsigned long>(ch) > 0xFF ||
           internal::lookup_tables<0>::lookup_node_name[static_cast<unsigned char>(ch)];
}

template <>
inline unsigned char xml_document<wchar_t>::attribute_name_pred::test(wchar_t ch)
{
    return static_cast<unsigned long>(ch) > 0xFF ||
           internal::lookup_tables<0>::lookup_attribute_name[static_cast<unsigned char>(ch)];
}

template <>
inline unsigned char xml_document<wchar_t>::text_pred::test(wchar_t ch)
{
    return ch != 0 && ch != L'<';
}

template <>
inline unsigned char xml_document<wchar_t>::text_pure_no_ws_pred::test(wchar_t ch)
{
    return ch != 0 && ch != L'<' && ch != L'&';
}

template <>
inline unsigned char xml_document<wchar_t>::text_pure_with_ws_pred::test(wchar_t ch)
{
    return ch != 0 && ch != L'<' && ch != L'&' && !whitespace_pred::test(ch);
}

template <>
template <>
inline unsigned char xml_document<wchar_t>::attribute_value_pred<L'"'>::test(wchar_t ch)
{
    return ch != 0 && ch != L'"';
}

template <>
template <>
inline unsigned char xml_document<wchar_t>::attribute_value_pred<L'\''>::test(wchar_t ch)
{
    return ch != 0 && ch != L'\'';
}

template <>
template <>
inline unsigned char xml_document<wchar_t>::attribute_value_pure_pred<L'"'>::test(wchar_t ch)
{
    return ch != 0 && ch != L'"' && ch != L'&';
}

template <>
template <>
inline unsigned char xml_document<wchar_t>::attribute_value_pure_pred<L'\''>::test(wchar_t ch)
{
    return ch != 0 && ch != L'\'' && ch != L'&';
}

} // namespace rapidxml

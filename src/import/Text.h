#pragma once

#include "framework/kernel/Format.h"

#include <string>

namespace Import
{

/// A text of the program in the user's language, with its values in place of %1, %2 ...:
/// Text("The folder %1 does not exist.", "Program", folder). Text and context are literals, which is how the tools that
/// collect what is to be translated find them.
template <std::size_t TextSize, std::size_t ContextSize, typename... TValues>
[[nodiscard]] std::string Text(char const (&text)[TextSize], char const (&context)[ContextSize],
                               TValues const &... values)
{
    return Kernel::Format(Kernel::LocalisedString(text, context), values...).ToStd();
}

/// The form of a text that fits a count, by the plural rules of the user's language, not yet filled in.
[[nodiscard]] String ChooseForm(char const * one, char const * many, char const * context, unsigned long count);

/// A text that counts something: CountText("%1 page", "%1 pages", "Program", pages). The count stands for %1; further
/// values follow as %2 ...
template <std::integral TCount, typename... TValues>
[[nodiscard]] std::string CountText(char const * one, char const * many, char const * context, TCount count,
                                    TValues const &... values)
{
    return Kernel::Format(ChooseForm(one, many, context, static_cast<unsigned long>(count)), count, values...).ToStd();
}

}

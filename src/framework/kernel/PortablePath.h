#pragma once

#include "framework/kernel/StringT.h"

namespace Kernel
{

/// Paths in a file that is to be moved together with what it refers to: "./" and the way on from the file's own folder.
/// Any other path stands for itself.
class PortablePath
{
public:
    /// How a file at `filePath` names `path`: from its own folder if that holds it, else as it is.
    [[nodiscard]] static String Make(String const & path, String const & filePath);
    /// The path that a text read from the file at `filePath` stands for.
    [[nodiscard]] static String Resolve(String const & text, String const & filePath);
};

}

#pragma once

#include "framework/kernel/Abortable.h"
#include "framework/kernel/FileStreamErrorHandler.h"

namespace Book
{

/// Turns a failed write into an abort of the export. It reports nothing by itself.
class ExportErrorHandler : public Kernel::FileStreamErrorHandler
{
public:
    /// `abort` outlives the stream that this handler is set on.
    explicit ExportErrorHandler(bool * abort) : m_Abort(abort) {}

    void OnWriteError(Kernel::FileIOException const &) override { Kernel::Abortable::SetFlag(m_Abort); }

private:
    bool * m_Abort;
};

}

#pragma once

#include "framework/kernel/StringT.h"

#include <functional>
#include <memory>

namespace Kernel
{

/// What the file layer is about to do to the disk.
enum class DiskOperation
{
    Open,
    Read,
    Write,
    Flush,
    Rename,
    Delete,
    CreateFolder,
};

/// A seam in the file layer by which a test makes the disk fail. Every call of the system that touches a file asks here
/// first. Without a handler, which is the normal state, asking costs one atomic read.
class DiskFault
{
public:
    /// Gets the operation and the file's path; gives 0 to let it happen, or the `errno` value with which it is to fail.
    /// Called on the thread that works on the file, perhaps on several at once.
    using Handler = std::function<int(DiskOperation, String const & path)>;

    /// 0, or the `errno` value of the failure that the handler wants. Sets `errno` to it.
    static int Ask(DiskOperation operation, char const * path);

    /// Puts a handler in; an empty one takes it out. Not while another thread works on files.
    static void SetHandler(Handler handler);
};

/// For the lifetime of this object the n-th operation of one kind (counted from 1), and each one after it, fails with
/// the given `errno` value. The count of the operations seen is kept, so that a test can fail each of them in turn.
class DiskFaultFromNth
{
public:
    DiskFaultFromNth(DiskOperation operation, int nth, int errorNumber);
    ~DiskFaultFromNth();
    DiskFaultFromNth(DiskFaultFromNth const &) = delete;
    DiskFaultFromNth & operator=(DiskFaultFromNth const &) = delete;

    /// Operations of that kind so far, failed ones included.
    [[nodiscard]] int Seen() const;

private:
    struct State;
    std::shared_ptr<State> m_State;
};

}

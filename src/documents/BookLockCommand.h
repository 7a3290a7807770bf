#pragma once

#include "framework/document/DocumentCommand.h"

namespace Book
{

/// Makes one document hold still against the user's edits, or lets it go. Runs on the document's own queue, is no step
/// that the user sees, and never enters the document's history.
class BookLockCommand final : public DocumentCommand
{
public:
    explicit BookLockCommand(bool engage);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override { return {}; }
    void Do() override;
    void Undo() override {}
    void Redo() override {}
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> &) override {}
    [[nodiscard]] bool ShouldStackForUndo() const override { return false; }

    void Save(Kernel::OutSerialiser &) const override {}
    bool Load(Kernel::InSerialiser const &, Kernel::FileStore &, unsigned short) override { return true; }
    [[nodiscard]] Kernel::ClassProperties const & GetObjectClassProperties() const override;
    static Kernel::ClassProperties const & GetTypeClassProperties();
    static Kernel::Counted<Kernel::Serialisable> CreateObject();

private:
    static Kernel::ClassProperties const ms_ClassProperties;

    bool const m_Engage;
};

}

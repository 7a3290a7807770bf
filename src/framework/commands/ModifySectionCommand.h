#pragma once

#include "framework/commands/DocumentCommandBase.h"

#include <optional>

/// Changes the section whose first page has the given index. What is not set stays.
class ModifySectionCommand : public UndoableDocumentCommand
{
public:
    explicit ModifySectionCommand(unsigned int startPageIndex) : m_StartPageIndex(startPageIndex) {}

    /// The number of the section's first page, which no longer runs on from the section before.
    void SetStartNumberingAt(unsigned int number) { m_Number = number; }
    /// Whether it sets its own number. The document's first section always does.
    void SetRestartPageNumbering(bool restart) { m_Restart = restart; }
    void SetIncludeOnExport(bool include) { m_Include = include; }
    void SetFormat(PageNumberFormat format, String const & prefix);

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Undo() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    unsigned int const m_StartPageIndex;
    std::optional<unsigned int> m_Number;
    std::optional<bool> m_Restart;
    std::optional<bool> m_Include;
    std::optional<PageNumberFormat> m_Format;
    String m_Prefix;
    std::vector<DocumentSection::Values> m_Before;
};

/// Begins a section at a page that begins none yet.
class InsertSectionCommand : public UndoableDocumentCommand
{
public:
    explicit InsertSectionCommand(DocumentSection::Values values) : m_Values(std::move(values)) {}

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Undo() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    DocumentSection::Values const m_Values;
    std::vector<DocumentSection::Values> m_Before;
};

/// Lets the section that begins at a page go on as part of the one before. Not for the first.
class DeleteSectionCommand : public UndoableDocumentCommand
{
public:
    explicit DeleteSectionCommand(unsigned int startPageIndex) : m_StartPageIndex(startPageIndex) {}

    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;
    void Do() override;
    void Undo() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

private:
    unsigned int const m_StartPageIndex;
    std::vector<DocumentSection::Values> m_Before;
};

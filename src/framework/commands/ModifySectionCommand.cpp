#include "framework/commands/ModifySectionCommand.h"

#include "framework/commands/CommandException.h"
#include "framework/kernel/Format.h"

namespace
{

CommandRegistration const s_Modify(typeid(ModifySectionCommand), "ModifySectionCommand");
CommandRegistration const s_Insert(typeid(InsertSectionCommand), "InsertSectionCommand");
CommandRegistration const s_Delete(typeid(DeleteSectionCommand), "DeleteSectionCommand");

std::vector<DocumentSection::Values> ValuesOf(DocumentNode const & document)
{
    std::vector<DocumentSection::Values> values;
    for (Kernel::Counted<DocumentSection const> const & section : document.GetAllSections()) {
        values.push_back(section->GetValues());
    }
    return values;
}

std::vector<DocumentSection::Values>::iterator Find(std::vector<DocumentSection::Values> & sections,
                                                    unsigned int startPageIndex)
{
    return std::find_if(sections.begin(), sections.end(),
                        [startPageIndex](auto const & values) { return startPageIndex == values.m_StartPageIndex; });
}

void SetSections(DocumentController & controller, std::vector<DocumentSection::Values> sections)
{
    controller.GetDocument()->SetSections(std::move(sections));
    // Pages lie by their numbers.
    controller.SetTextDirty();
}

String NoSection(unsigned int page)
{
    return Kernel::Format(Kernel::LocalisedString("No section begins at page %1 of the document.", "Sections"),
                          page + 1);
}

}

void ModifySectionCommand::SetFormat(PageNumberFormat format, String const & prefix)
{
    m_Format = format;
    m_Prefix = prefix;
}

Kernel::LocalisedString ModifySectionCommand::GetDescription() const
{
    return Kernel::LocalisedString("Change section", "Document Command");
}

void ModifySectionCommand::Do()
{
    std::vector<DocumentSection::Values> sections = ValuesOf(Tree());
    auto const section = Find(sections, m_StartPageIndex);
    if (section == sections.end()) {
        throw CommandException(NoSection(m_StartPageIndex));
    }
    m_Before = sections;
    if (m_Number) {
        section->m_StartNumberingAt = *m_Number;
        section->m_RestartPageNumbering = true;
    }
    section->m_RestartPageNumbering = m_Restart.value_or(section->m_RestartPageNumbering);
    section->m_IncludeOnExport = m_Include.value_or(section->m_IncludeOnExport);
    if (m_Format) {
        section->m_Format = *m_Format;
        section->m_Prefix = m_Prefix;
    }
    SetSections(*GetDocument(), std::move(sections));
}

void ModifySectionCommand::Undo()
{
    SetSections(*GetDocument(), m_Before);
}

void ModifySectionCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    notifications.push_back(Kernel::MakeCounted<DocumentSectionChangedNotification>(Self()));
}

Kernel::LocalisedString InsertSectionCommand::GetDescription() const
{
    return Kernel::LocalisedString("Insert section", "Document Command");
}

void InsertSectionCommand::Do()
{
    std::vector<DocumentSection::Values> sections = ValuesOf(Tree());
    if (Find(sections, m_Values.m_StartPageIndex) != sections.end()) {
        throw CommandException(
            Kernel::Format(Kernel::LocalisedString("A section begins at page %1 already.", "Sections"),
                           m_Values.m_StartPageIndex + 1));
    }
    m_Before = sections;
    sections.push_back(m_Values);
    SetSections(*GetDocument(), std::move(sections));
}

void InsertSectionCommand::Undo()
{
    SetSections(*GetDocument(), m_Before);
}

void InsertSectionCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    notifications.push_back(Kernel::MakeCounted<DocumentSectionAddedNotification>(Self()));
}

Kernel::LocalisedString DeleteSectionCommand::GetDescription() const
{
    return Kernel::LocalisedString("Delete section", "Document Command");
}

void DeleteSectionCommand::Do()
{
    std::vector<DocumentSection::Values> sections = ValuesOf(Tree());
    auto const section = Find(sections, m_StartPageIndex);
    if (section == sections.end() || section == sections.begin()) {
        throw CommandException(section == sections.end() ? NoSection(m_StartPageIndex)
                                                         : String(Kernel::LocalisedString(
                                                               "A document keeps its first section.", "Sections")));
    }
    m_Before = sections;
    sections.erase(section);
    SetSections(*GetDocument(), std::move(sections));
}

void DeleteSectionCommand::Undo()
{
    SetSections(*GetDocument(), m_Before);
}

void DeleteSectionCommand::Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications)
{
    notifications.push_back(Kernel::MakeCounted<DocumentSectionChangedNotification>(Self()));
}

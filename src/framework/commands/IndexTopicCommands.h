#pragma once

#include "framework/commands/DocumentCommandBase.h"

/// Base of the commands that change the document's topic index: undo puts the whole content back. A command on a topic
/// that is not in the document's index fails.
class IndexTopicCommand : public UndoableDocumentCommand
{
public:
    void Do() override;
    void Undo() override;
    void Notify(std::vector<Kernel::Counted<Kernel::Notification>> & notifications) override;

protected:
    /// Makes the change; throws `CommandException` if it can't.
    virtual void Change(Story::Index & index) = 0;
    /// The topic for changing; throws if it is null or not in the index.
    [[nodiscard]] static Kernel::JailCounted<Story::IndexTopic>
    Require(Story::Index const & index, Kernel::Counted<Story::IndexTopic const> const & topic);

private:
    /// Marks in the text name their topic in full: brings those that a change of names has left behind in step. Marks
    /// within notes and tables keep the old name, which then has no topic.
    void RenameMarks(std::vector<std::pair<Kernel::Counted<Story::IndexTopic const>, String>> const & oldNames);

    struct ChangedMark
    {
        Kernel::Counted<TextFlow> m_Flow;
        std::size_t m_Offset;
        Kernel::Counted<Story::Glyph const> m_Glyph;
    };

    std::shared_ptr<Story::Index::Content const> m_Before;
    std::vector<ChangedMark> m_ChangedMarks;
};

/// Adds topics; those whose GUID is taken are left out.
class AddIndexTopicCommand : public IndexTopicCommand
{
public:
    explicit AddIndexTopicCommand(std::vector<Kernel::Counted<Story::IndexTopic>> const & topics) : m_Topics(topics) {}
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;

protected:
    void Change(Story::Index & index) override;

private:
    std::vector<Kernel::Counted<Story::IndexTopic>> const m_Topics;
};

namespace Commands
{

/// Base of the commands that set one text of a topic.
class SetIndexTopicTextCommand : public IndexTopicCommand
{
protected:
    SetIndexTopicTextCommand(Kernel::Counted<Story::IndexTopic const> topic, String text)
        : m_Topic(std::move(topic)),
          m_Text(std::move(text))
    {
    }

    Kernel::Counted<Story::IndexTopic const> const m_Topic;
    String const m_Text;
};

class SetIndexTopicGUIDCommand : public SetIndexTopicTextCommand
{
public:
    SetIndexTopicGUIDCommand(Kernel::Counted<Story::IndexTopic const> topic, String guid)
        : SetIndexTopicTextCommand(std::move(topic), std::move(guid))
    {
    }
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;

protected:
    void Change(Story::Index & index) override;
};

/// Marks in the text follow.
class RenameIndexTopicCommand : public SetIndexTopicTextCommand
{
public:
    RenameIndexTopicCommand(Kernel::Counted<Story::IndexTopic const> topic, String name)
        : SetIndexTopicTextCommand(std::move(topic), std::move(name))
    {
    }
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;

protected:
    void Change(Story::Index & index) override;
};

class SetIndexTopicSortCommand : public SetIndexTopicTextCommand
{
public:
    SetIndexTopicSortCommand(Kernel::Counted<Story::IndexTopic const> topic, String sortString)
        : SetIndexTopicTextCommand(std::move(topic), std::move(sortString))
    {
    }
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;

protected:
    void Change(Story::Index & index) override;
};

/// Base of the commands on two topics.
class IndexTopicPairCommand : public IndexTopicCommand
{
protected:
    IndexTopicPairCommand(Kernel::Counted<Story::IndexTopic const> topic,
                          Kernel::Counted<Story::IndexTopic const> other)
        : m_Topic(std::move(topic)),
          m_Other(std::move(other))
    {
    }

    Kernel::Counted<Story::IndexTopic const> const m_Topic;
    Kernel::Counted<Story::IndexTopic const> const m_Other;
};

/// Puts the topic under `parent`, or at the top level if that is null.
class ReparentIndexTopicCommand : public IndexTopicPairCommand
{
public:
    ReparentIndexTopicCommand(Kernel::Counted<Story::IndexTopic const> topic,
                              Kernel::Counted<Story::IndexTopic const> parent)
        : IndexTopicPairCommand(std::move(topic), std::move(parent))
    {
    }
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;

protected:
    void Change(Story::Index & index) override;
};

class AddIndexCrossReferenceCommand : public IndexTopicPairCommand
{
public:
    AddIndexCrossReferenceCommand(Kernel::Counted<Story::IndexTopic const> topic,
                                  Kernel::Counted<Story::IndexTopic const> other)
        : IndexTopicPairCommand(std::move(topic), std::move(other))
    {
    }
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;

protected:
    void Change(Story::Index & index) override;
};

class DeleteIndexCrossReferenceCommand : public IndexTopicPairCommand
{
public:
    DeleteIndexCrossReferenceCommand(Kernel::Counted<Story::IndexTopic const> topic,
                                     Kernel::Counted<Story::IndexTopic const> other)
        : IndexTopicPairCommand(std::move(topic), std::move(other))
    {
    }
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;

protected:
    void Change(Story::Index & index) override;
};

/// Those below the topics move up to the nearest parent that stays.
class DeleteIndexTopicCommand : public IndexTopicCommand
{
public:
    explicit DeleteIndexTopicCommand(std::vector<Kernel::Counted<Story::IndexTopic const>> topics)
        : m_Topics(std::move(topics))
    {
    }
    [[nodiscard]] Kernel::LocalisedString GetDescription() const override;

protected:
    void Change(Story::Index & index) override;

private:
    std::vector<Kernel::Counted<Story::IndexTopic const>> const m_Topics;
};

}

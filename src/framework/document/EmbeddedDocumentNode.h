#pragma once

#include "framework/document/PictureNode.h"

/// The first page of another document file, such as a PDF, placed on a page. Its password, where it needs one, is kept
/// in memory only.
///
/// A protected PDF that pictures of the text show has such a node too, as a child of the document itself, without a place
/// and with the picture's id as its GUID: it carries the password for them.
class EmbeddedDocumentNode : public PictureNode
{
public:
    EmbeddedDocumentNode(Kernel::RectT<double> rect, String path, String guid, bool isProtected)
        : PictureNode(rect, std::move(path), std::move(guid)),
          m_IsProtected(isProtected)
    {
    }

    [[nodiscard]] Kind GetKind() const override { return Kind::EmbeddedDocument; }
    /// The file can't be read without a password.
    [[nodiscard]] bool IsProtected() const { return m_IsProtected; }
    void SetPassword(String const & password) { m_Password = password; }
    [[nodiscard]] String GetPassword() const { return m_Password; }

private:
    String m_Password;
    bool m_IsProtected;
};

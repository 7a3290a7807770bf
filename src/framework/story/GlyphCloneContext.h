#pragma once

namespace Story
{

/// Says what becomes of identities while special elements are copied, and lives as long as one copy runs.
class GlyphCloneContext
{
public:
    /// With `newIdentities`, anchors in the copy get new uids; otherwise they keep those of the original, as a text
    /// that moves wants it.
    explicit GlyphCloneContext(bool newIdentities) : m_NewIdentities(newIdentities) {}

    [[nodiscard]] bool WantsNewIdentities() const { return m_NewIdentities; }

private:
    bool m_NewIdentities;
};

}

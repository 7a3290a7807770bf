#include "framework/kernel/InSerialiser.h"
#include "framework/kernel/OutSerialiser.h"
#include "framework/story/ByteStream.h"
#include "framework/story/Index.h"
#include "framework/story/Story.h"
#include "framework/story/StyleSheet.h"

namespace Story
{

namespace
{

// Each of the three objects is one block of bytes with a format number of its own in front, under this tag.
constexpr Kernel::IDTag BlockTag{"Blck"};

template <typename T>
Kernel::Counted<Kernel::Serialisable> Create()
{
    return Kernel::MakeCounted<T>();
}

template <typename T>
void SaveBlock(T const & object, Kernel::OutSerialiser & out)
{
    ByteWriter block;
    object.SaveBytes(block);
    auto const & bytes = block.GetBytes();
    out.SaveData(BlockTag, {reinterpret_cast<std::uint8_t const *>(bytes.data()), bytes.size()});
}

template <typename T>
bool LoadBlock(T & object, Kernel::InSerialiser const & in)
{
    std::span<std::uint8_t const> bytes;
    if (!in.LoadData(BlockTag, bytes)) {
        return false;
    }
    ByteReader block({reinterpret_cast<std::byte const *>(bytes.data()), bytes.size()});
    return object.LoadBytes(block);
}

constexpr Kernel::ClassProperties StoryProperties("StSt", Create<Story>, 1, {}, nullptr);
constexpr Kernel::ClassProperties StyleSheetProperties("StSh", Create<StyleSheet>, 1, {}, nullptr);
constexpr Kernel::ClassProperties IndexProperties("StIx", Create<Index>, 1, {}, nullptr);

Kernel::ClassProperties::Init const s_storyInit(StoryProperties);
Kernel::ClassProperties::Init const s_styleSheetInit(StyleSheetProperties);
Kernel::ClassProperties::Init const s_indexInit(IndexProperties);

}

void Story::Save(Kernel::OutSerialiser & out) const
{
    SaveBlock(*this, out);
}

bool Story::Load(Kernel::InSerialiser const & in, Kernel::FileStore &, unsigned short)
{
    return LoadBlock(*this, in);
}

Kernel::ClassProperties const & Story::GetObjectClassProperties() const
{
    return StoryProperties;
}

void StyleSheet::Save(Kernel::OutSerialiser & out) const
{
    SaveBlock(*this, out);
}

bool StyleSheet::Load(Kernel::InSerialiser const & in, Kernel::FileStore &, unsigned short)
{
    return LoadBlock(*this, in);
}

Kernel::ClassProperties const & StyleSheet::GetObjectClassProperties() const
{
    return StyleSheetProperties;
}

void Index::Save(Kernel::OutSerialiser & out) const
{
    SaveBlock(*this, out);
}

bool Index::Load(Kernel::InSerialiser const & in, Kernel::FileStore &, unsigned short)
{
    return LoadBlock(*this, in);
}

Kernel::ClassProperties const & Index::GetObjectClassProperties() const
{
    return IndexProperties;
}

}

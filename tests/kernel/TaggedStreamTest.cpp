#include "framework/kernel/InSerialiserFile.h"
#include "framework/kernel/OutSerialiserFile.h"

#include "framework/kernel/ArchiveExceptions.h"
#include "framework/kernel/MemoryStreams.h"

#include <gtest/gtest.h>

#include <limits>

using namespace Kernel;

namespace
{

enum class Colour : std::uint32_t
{
    Red = 7
};

class Shade : public SharedSerialisable
{
public:
    void Save(OutSerialiser & out) const override
    {
        out.SaveType("valu", m_Value);
        out.SaveSharedObject("base", m_Base);
    }
    bool Load(InSerialiser const & in, FileStore &, unsigned short) override
    {
        in.LoadType("valu", m_Value);
        in.LoadSharedObject("base", m_Base);
        return true;
    }
    ClassProperties const & GetObjectClassProperties() const override { return ms_ClassProperties; }
    static Counted<Serialisable> CreateObject() { return MakeCounted<Shade>(); }
    static ClassProperties const ms_ClassProperties;

    int m_Value = 0;
    Consolidated<Shade> m_Base;
};

class Item : public Serialisable
{
public:
    void Save(OutSerialiser & out) const override
    {
        out.SaveType("numb", m_Number);
        out.SaveType("name", m_Name);
        out.SaveObjects("subs", m_Children);
        out.SaveSharedObject("shad", m_Shade);
        out.ReferToPath(m_Name);
    }
    bool Load(InSerialiser const & in, FileStore &, unsigned short version) override
    {
        m_LoadedVersion = version;
        in.LoadType("numb", m_Number);
        in.LoadType("name", m_Name);
        in.LoadObjects("subs", m_Children);
        in.LoadSharedObject("shad", m_Shade);
        return m_Number != 13;
    }
    ClassProperties const & GetObjectClassProperties() const override { return *ms_Written; }
    static Counted<Serialisable> CreateObject() { return MakeCounted<Item>(); }
    static ClassProperties const ms_ClassProperties;
    static ClassProperties const * ms_Written;

    int m_Number = 42;
    String m_Name;
    std::vector<Counted<Item>> m_Children;
    Consolidated<Shade> m_Shade;
    unsigned short m_LoadedVersion = 0;
};

ClassPropertiesBase::DefaultItem const s_Defaults[] = {{"numb", PropType::Int32, 42}};
ClassProperties const Shade::ms_ClassProperties("TtSh", &Shade::CreateObject, 1, {}, nullptr);
ClassPropertiesBase::Init const s_ShadeInit(Shade::ms_ClassProperties);
ClassProperties const Item::ms_ClassProperties("TtIt", &Item::CreateObject, 3, s_Defaults, nullptr);
ClassPropertiesBase::Init const s_ItemInit(Item::ms_ClassProperties);
ClassProperties const * Item::ms_Written = &Item::ms_ClassProperties;
ClassProperties const s_Later("TtIt", nullptr, 4, {}, nullptr);
ClassProperties const s_Unknown("TtUn", nullptr, 1, {}, nullptr);

class TaggedStreamTest : public testing::Test
{
protected:
    ~TaggedStreamTest() override { Item::ms_Written = &Item::ms_ClassProperties; }

    template <typename TWork>
    Counted<RawData> Write(TWork const & work)
    {
        MemoryOutStream stream;
        OutSerialiserFile out(stream, m_Out, "Root", 5);
        work(out);
        out.Close();
        return stream.RelinquishOwnership();
    }

    Counted<InSerialiserFile> Parse(Counted<RawData const> const & data)
    {
        MemoryInStream stream(data, "test.kvdoc (doc.dat)");
        return InSerialiserFile::ParseWithChecks(stream, m_Store, m_Delay, m_Progress,
                                                 [this](ClassUID uid) { m_Unknown.push_back(uid); });
    }

    static Counted<Item> MakeItem(int number)
    {
        auto item = MakeCounted<Item>();
        item->m_Number = number;
        return item;
    }

    CollectingFileStoreOut m_Out{true};
    EmptyFileStore m_Store;
    InSerialiser::DelayLoadsBehaviour m_Delay = InSerialiser::DelayLoadsBehaviour::CheckAll;
    std::function<bool(float)> m_Progress;
    std::vector<ClassUID> m_Unknown;
};

}

TEST_F(TaggedStreamTest, EveryKindOfFieldComesBackInAnyOrder)
{
    std::vector<double> const numbers{0.1, -1e300, std::numeric_limits<double>::infinity()};
    auto const data = Write([&](OutSerialiser & out) {
        out.SaveType("bool", true);
        out.SaveType("strg", String("na\0me", 5));
        out.SaveType("int8", std::int8_t(-8));
        out.SaveType("ui16", std::uint16_t(65535));
        out.SaveType("in32", -7);
        out.SaveType("ui64", std::numeric_limits<std::uint64_t>::max());
        out.SaveType("doub", 0.1);
        out.SaveType("floa", 0.5f);
        out.SaveType("enum", Colour::Red);
        out.SaveType("time", TimeStamp(-5));
        out.SaveType("rect", RectT<double>{1, 2, 3, 4});
        out.SaveType("u16s", std::u16string(u"a\xFFFC"));
        out.SaveType("list", std::vector<String>{"one", "", "three"});
        out.SaveArray("arra", numbers);
        out.SaveArray("none", std::vector<int>{});
    });
    auto const in = Parse(data);
    ASSERT_TRUE(in);
    EXPECT_EQ(IDTag("Root"), in->GetRootTag());
    EXPECT_EQ(5, in->GetVersion());

    std::vector<int> none{1};
    EXPECT_TRUE(in->LoadArray("none", none));
    EXPECT_TRUE(none.empty());
    bool boolean = false;
    EXPECT_TRUE(in->LoadType("bool", boolean) && boolean);
    std::span<double const> view;
    ASSERT_TRUE(in->LoadView("arra", view));
    EXPECT_TRUE(std::equal(view.begin(), view.end(), numbers.begin(), numbers.end()));
    EXPECT_EQ(0u, reinterpret_cast<std::uintptr_t>(view.data()) % 8);
    EXPECT_LE(static_cast<void const *>(data->GetData()), static_cast<void const *>(view.data())) << "not a copy";
    EXPECT_EQ(data.Get(), in->GetBuffer().Get());
    String text;
    EXPECT_TRUE(in->LoadType("strg", text));
    EXPECT_EQ(String("na\0me", 5), text);
    std::int8_t int8 = 0;
    std::uint16_t uint16 = 0;
    int int32 = 0;
    std::uint64_t uint64 = 0;
    double real = 0;
    float single = 0;
    Colour colour{};
    TimeStamp time;
    RectT<double> rect;
    std::u16string units;
    std::vector<String> list;
    EXPECT_TRUE(in->LoadType("int8", int8) && in->LoadType("ui16", uint16) && in->LoadType("in32", int32) &&
                in->LoadType("ui64", uint64) && in->LoadType("doub", real) && in->LoadType("floa", single) &&
                in->LoadType("enum", colour) && in->LoadType("time", time) && in->LoadType("rect", rect) &&
                in->LoadType("u16s", units) && in->LoadType("list", list));
    EXPECT_EQ(-8, int8);
    EXPECT_EQ(65535, uint16);
    EXPECT_EQ(-7, int32);
    EXPECT_EQ(std::numeric_limits<std::uint64_t>::max(), uint64);
    EXPECT_EQ(0.1, real);
    EXPECT_EQ(0.5f, single);
    EXPECT_EQ(Colour::Red, colour);
    EXPECT_EQ(TimeStamp(-5), time);
    EXPECT_EQ((RectT<double>{1, 2, 3, 4}), rect);
    EXPECT_EQ(u"a\xFFFC", units);
    EXPECT_EQ((std::vector<String>{"one", "", "three"}), list);
}

TEST_F(TaggedStreamTest, AMissingFieldOrOneOfAnotherTypeLeavesTheTarget)
{
    auto const in = Parse(Write([](OutSerialiser & out) { out.SaveType("numb", 7); }));
    String text = "kept";
    EXPECT_FALSE(in->LoadType("none", text));
    EXPECT_FALSE(in->LoadType("numb", text)) << "a number is no text";
    EXPECT_EQ("kept", text);
    double real = 1.5;
    EXPECT_FALSE(in->LoadType("numb", real));
    EXPECT_EQ(1.5, real);
    Counted<Item> item = MakeItem(1);
    EXPECT_FALSE(in->LoadObject("none", item));
    EXPECT_TRUE(item);
    std::vector<std::int16_t> values{3};
    EXPECT_FALSE(in->LoadArray("numb", values));
    EXPECT_TRUE(in->HasField("numb"));
    EXPECT_FALSE(in->HasField("none"));
}

TEST_F(TaggedStreamTest, ObjectsKeepTheirClassVersionChildrenAndNulls)
{
    auto const parent = MakeItem(1);
    parent->m_Children = {MakeItem(2), nullptr, MakeItem(3)};
    parent->m_Children[2]->m_Children = {MakeItem(4)};
    auto const in = Parse(Write([&](OutSerialiser & out) {
        out.SaveObject("item", parent, true);
        out.SaveObject("null", nullptr, true);
        out.SaveObject("gone", nullptr, false);
        out.SaveObject("shad", MakeCounted<Shade>(), true);
        out.SaveObject("bad ", MakeItem(13), true);
        out.SaveObjects("none", std::vector<Counted<Item>>{});
    }));
    Counted<Item> loaded;
    ASSERT_TRUE(in->LoadObject("item", loaded) && loaded);
    EXPECT_EQ(3, loaded->m_LoadedVersion);
    ASSERT_EQ(3u, loaded->m_Children.size());
    EXPECT_EQ(nullptr, loaded->m_Children[1]);
    EXPECT_EQ(4, loaded->m_Children[2]->m_Children.at(0)->m_Number);
    EXPECT_TRUE(loaded->Equals(parent.Get(), CompareContext()));

    for (IDTag const tag : {IDTag("null"), IDTag("shad"), IDTag("bad ")}) {
        Counted<Item> target = MakeItem(9);
        EXPECT_TRUE(in->LoadObject(tag, target)) << "the field is there";
        EXPECT_EQ(nullptr, target) << "null, of another class, or refused by its Load";
    }
    EXPECT_FALSE(in->HasField("gone"));
    std::vector<Counted<Item>> list{nullptr};
    EXPECT_TRUE(in->LoadObjects("none", list));
    EXPECT_TRUE(list.empty());
}

TEST_F(TaggedStreamTest, ASharedValueIsWrittenOnceAndComesBackAsOneObject)
{
    auto const base = MakeCounted<Shade>();
    base->m_Value = 1;
    auto const shade = MakeCounted<Shade>();
    shade->m_Base = Consolidated<Shade>(base);
    Consolidated<Shade> const shared(shade);
    auto const data = Write([&](OutSerialiser & out) {
        out.SaveSharedObject("frst", shared);
        out.SaveSharedObject("scnd", shared);
        out.SaveSharedObject("base", shade->m_Base);
        out.SaveSharedObject("null", Consolidated<Shade>());
    });
    std::string const bytes(reinterpret_cast<char const *>(data->GetData()), data->GetSize());
    EXPECT_EQ(bytes.find("TtSh", bytes.find("TtSh", bytes.find("TtSh") + 1) + 1), std::string::npos)
        << "two objects, whatever refers to them";
    auto const in = Parse(data);
    Consolidated<Shade> first;
    Consolidated<Shade> second;
    Consolidated<Shade> loadedBase;
    Consolidated<Shade> null(shade);
    // The last first: what is defined inside of another must be found before that one is loaded.
    ASSERT_TRUE(in->LoadSharedObject("base", loadedBase) && in->LoadSharedObject("scnd", second) &&
                in->LoadSharedObject("frst", first) && in->LoadSharedObject("null", null));
    EXPECT_EQ(first, second);
    EXPECT_EQ(first->m_Base, loadedBase);
    EXPECT_EQ(1, loadedBase->m_Value);
    EXPECT_FALSE(null);
}

TEST_F(TaggedStreamTest, AFieldAtItsDefaultIsNotWritten)
{
    auto const withDefault = Write([](OutSerialiser & out) { out.SaveObject("item", MakeItem(42), true); });
    auto const without = Write([](OutSerialiser & out) { out.SaveObject("item", MakeItem(43), true); });
    EXPECT_EQ(withDefault->GetSize() + 24, without->GetSize());
    Counted<Item> item;
    ASSERT_TRUE(Parse(withDefault)->LoadObject("item", item));
    EXPECT_EQ(42, item->m_Number);
}

TEST_F(TaggedStreamTest, AClassVersionAboveOursFailsTheWholeStreamUnlessDelayed)
{
    Item::ms_Written = &s_Later;
    auto const parent = MakeItem(1);
    auto const data = Write([&](OutSerialiser & out) { out.SaveObject("item", parent, true); });
    EXPECT_THROW(static_cast<void>(Parse(data)), FutureVersionException);
    m_Delay = InSerialiser::DelayLoadsBehaviour::Delay;
    auto const in = Parse(data);
    ASSERT_TRUE(in);
    Counted<Item> item;
    EXPECT_THROW(in->LoadObject("item", item), FutureVersionException);
}

TEST_F(TaggedStreamTest, AnUnknownClassIsToldAndLoadsAsNull)
{
    Item::ms_Written = &s_Unknown;
    auto const data = Write([&](OutSerialiser & out) { out.SaveObject("item", MakeItem(1), true); });
    auto const in = Parse(data);
    EXPECT_EQ(std::vector<ClassUID>{"TtUn"}, m_Unknown);
    Counted<Item> item = MakeItem(2);
    EXPECT_TRUE(in->LoadObject("item", item));
    EXPECT_EQ(nullptr, item);
}

TEST_F(TaggedStreamTest, DamageIsFoundBeforeAnythingIsLoaded)
{
    auto const parent = MakeItem(1);
    parent->m_Name = "a name";
    parent->m_Children = {MakeItem(2), MakeItem(3)};
    parent->m_Shade = Consolidated<Shade>(MakeCounted<Shade>());
    auto const good = Write([&](OutSerialiser & out) {
        out.SaveObject("item", parent, true);
        out.SaveType("list", std::vector<String>{"one", "two"});
        out.SaveArray("arra", std::vector<int>{1, 2, 3});
    });
    std::span<std::uint8_t const> const bytes = good->GetSpan();

    // Cut anywhere, the stream is refused; below four bytes it is not one at all.
    for (std::size_t size = 0; size < bytes.size(); ++size) {
        auto const cut = MakeCounted<RawData>(RawData::Bytes(bytes.begin(), bytes.begin() + static_cast<long>(size)));
        if (size < 4) {
            EXPECT_EQ(nullptr, Parse(cut));
        } else {
            EXPECT_THROW(static_cast<void>(Parse(cut)), ArchiveCorruptionException) << size;
        }
    }
    // Whatever byte is changed: refused, or read without a fault that a sanitizer would see.
    int refused = 0;
    for (std::size_t at = 0; at < bytes.size(); ++at) {
        for (std::uint8_t const mask : {0x01, 0x80, 0xFF}) {
            auto const bad = MakeCounted<RawData>(RawData::Bytes(bytes.begin(), bytes.end()));
            bad->GetMutableData()[at] ^= mask;
            try {
                auto const in = Parse(bad);
                Counted<Item> item;
                std::vector<String> list;
                if (in) {
                    in->LoadObject("item", item);
                    in->LoadType("list", list);
                }
            } catch (Exception const &) {
                ++refused;
            }
        }
    }
    EXPECT_GT(refused, 100);
}

TEST_F(TaggedStreamTest, NestingIsBounded)
{
    // Built by hand, as the writer asserts the same bound: an object that holds one field, which is an object ...
    std::vector<std::uint8_t> inner;
    for (int depth = 0; depth < 5000; ++depth) {
        std::vector<std::uint8_t> object{'T', 't', 'I', 't', 1, 0, 0, 0};
        if (!inner.empty()) {
            std::uint64_t const length = inner.size();
            object.insert(object.end(), {'s', 'u', 'b', 's', 11, 0, 0, 0});
            object.insert(object.end(), reinterpret_cast<std::uint8_t const *>(&length),
                          reinterpret_cast<std::uint8_t const *>(&length + 1));
            object.insert(object.end(), inner.begin(), inner.end());
        }
        inner = std::move(object);
    }
    std::uint64_t const length = inner.size();
    std::uint64_t const total = length + 16;
    RawData::Bytes whole{'K', 'v', 'T', 's', 1, 0, 1, 0, 'R', 'o', 'o', 't', 0, 0, 0, 0};
    auto const put = [&whole](std::uint64_t number) {
        whole.insert(whole.end(), reinterpret_cast<std::uint8_t const *>(&number),
                     reinterpret_cast<std::uint8_t const *>(&number + 1));
    };
    put(total);
    whole.insert(whole.end(), {'i', 't', 'e', 'm', 11, 0, 0, 0});
    put(length);
    whole.insert(whole.end(), inner.begin(), inner.end());
    EXPECT_THROW(static_cast<void>(Parse(MakeCounted<RawData>(whole))), ArchiveCorruptionException);
}

TEST_F(TaggedStreamTest, ARunForPathsOnlyWritesNothingAndWalksEverything)
{
    auto const parent = MakeItem(1);
    parent->m_Name = "parent.png";
    auto const child = MakeItem(2);
    child->m_Name = "child.png";
    parent->m_Children = {child, nullptr};
    CollectingFileStoreOut store(false);
    MemoryOutStream stream;
    OutSerialiserFile out(stream, store, "Root", 1);
    ASSERT_FALSE(out.IsFullSave());
    out.SaveObjectEnumeratePathsOnlyI(parent);
    out.Close();
    EXPECT_EQ((std::vector<String>{"child.png", "parent.png"}), store.GetPaths());
    EXPECT_EQ(0u, stream.GetPosition());
}

TEST_F(TaggedStreamTest, ProgressRunsFromNoneToAllAndCanStop)
{
    auto const data = Write([](OutSerialiser & out) {
        out.SaveType("aaaa", 1);
        out.SaveType("bbbb", 1);
    });
    std::vector<float> seen;
    m_Progress = [&seen](float part) {
        seen.push_back(part);
        return true;
    };
    EXPECT_TRUE(Parse(data));
    EXPECT_EQ((std::vector<float>{0.0f, 0.5f, 1.0f}), seen);
    m_Progress = [](float part) { return part < 0.5f; };
    EXPECT_FALSE(Parse(data));
}

TEST_F(TaggedStreamTest, ValuesAreComparedWithoutTheFieldsThatAContextLeavesOut)
{
    struct WithoutNames : CompareContext
    {
        bool IgnoresField(IDTag tag) const override { return tag == IDTag("name"); }
    };
    auto const a = MakeItem(1);
    auto const b = MakeItem(1);
    b->m_Name = "other";
    EXPECT_FALSE(a->Equals(b.Get(), CompareContext()));
    EXPECT_TRUE(a->Equals(b.Get(), WithoutNames()));
    HashAccumulator hashA;
    HashAccumulator hashB;
    a->AccumulateHash(hashA);
    b->AccumulateHash(hashB);
    EXPECT_NE(hashA.Get128(), hashB.Get128());
}

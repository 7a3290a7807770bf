#include "framework/kernel/Exception.h"
#include "framework/kernel/InSerialiserFile.h"
#include "framework/kernel/MemoryStreams.h"
#include "framework/kernel/OutSerialiserFile.h"

#include <cstdlib>

using namespace Kernel;

namespace
{

/// Asks for a field of every kind under its tag, and writes back what it got.
class Node : public SharedSerialisable
{
public:
    void Save(OutSerialiser & out) const override
    {
        out.SaveType("bool", m_Bool);
        out.SaveType("strg", m_String);
        out.SaveType("in32", m_Int32);
        out.SaveType("in64", m_Int64);
        out.SaveType("doub", m_Double);
        out.SaveType("rect", m_Rect);
        out.SaveType("text", m_Text);
        out.SaveType("list", m_List);
        out.SaveArray("arra", m_Array);
        out.SaveObject("chld", m_Child, false);
        out.SaveObjects("subs", m_Children);
        out.SaveSharedObject("shar", m_Shared);
    }

    bool Load(InSerialiser const & in, FileStore &, unsigned short version) override
    {
        in.LoadType("bool", m_Bool);
        in.LoadType("strg", m_String);
        in.LoadType("in32", m_Int32);
        in.LoadType("in64", m_Int64);
        in.LoadType("doub", m_Double);
        in.LoadType("rect", m_Rect);
        in.LoadType("text", m_Text);
        in.LoadType("list", m_List);
        in.LoadArray("arra", m_Array);
        in.LoadObject("chld", m_Child);
        in.LoadObjects("subs", m_Children);
        in.LoadSharedObject("shar", m_Shared);
        return version != 0;
    }

    ClassProperties const & GetObjectClassProperties() const override { return ms_ClassProperties; }
    static Counted<Serialisable> CreateObject() { return MakeCounted<Node>(); }
    static ClassProperties const ms_ClassProperties;

private:
    bool m_Bool = false;
    String m_String;
    int m_Int32 = 0;
    std::uint64_t m_Int64 = 0;
    double m_Double = 0;
    RectT<double> m_Rect;
    std::u16string m_Text;
    std::vector<String> m_List;
    std::vector<std::uint32_t> m_Array;
    Counted<Node> m_Child;
    std::vector<Counted<Node>> m_Children;
    Consolidated<Node> m_Shared;
};

ClassProperties const Node::ms_ClassProperties("FzNd", &Node::CreateObject, 1, {}, nullptr);
ClassPropertiesBase::Init const s_Init(Node::ms_ClassProperties);

Counted<RawData> Write(Node const & node)
{
    CollectingFileStoreOut store(true);
    MemoryOutStream stream;
    OutSerialiserFile out(stream, store, "Fuzz", 1);
    out.SaveObject("root", &node, true);
    out.Close();
    return stream.RelinquishOwnership();
}

Counted<Node> Read(Counted<RawData const> const & data)
{
    EmptyFileStore store;
    MemoryInStream stream(data, "fuzz");
    auto const in =
        InSerialiserFile::ParseWithChecks(stream, store, InSerialiser::DelayLoadsBehaviour::CheckAll, nullptr, nullptr);
    Counted<Node> root;
    if (in) {
        in->LoadObject("root", root);
    }
    return root;
}

}

/// Any bytes are refused or read; and what was read once is written and read again to the same bytes.
extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const * data, std::size_t size)
{
    try {
        Counted<Node> const root = Read(MakeCounted<RawData>(RawData::Bytes(data, data + size)));
        if (root) {
            auto const once = Write(*root);
            Counted<Node> const again = Read(once);
            auto const twice = again ? Write(*again) : nullptr;
            if (!twice || !std::equal(once->GetSpan().begin(), once->GetSpan().end(), twice->GetSpan().begin(),
                                      twice->GetSpan().end())) {
                std::abort();
            }
        }
    } catch (Exception const &) {
        // Refused, with a sentence that says where.
    }
    return 0;
}

#include "framework/kernel/InSerialiserFile.h"

#include "framework/kernel/ArchiveExceptions.h"
#include "framework/kernel/Format.h"
#include "framework/kernel/InSerialiserContext.h"
#include "framework/kernel/TaggedStreamFormat.h"
#include "framework/kernel/TaggedStreamParser.h"

#include <algorithm>

namespace Kernel
{

using namespace TaggedStream;

InSerialiserFile::InSerialiserFile(std::unique_ptr<Context> context, std::span<std::uint8_t const> fields,
                                   IDTag rootTag, unsigned short version)
    : InSerialiser(*context, fields),
      m_OwnContext(std::move(context)),
      m_RootTag(rootTag),
      m_Version(version)
{
}

InSerialiserFile::~InSerialiserFile() = default;

Counted<InSerialiserFile> InSerialiserFile::ParseWithChecks(InStream & stream, FileStore & store,
                                                            DelayLoadsBehaviour delayLoads,
                                                            std::function<bool(float)> progress,
                                                            std::function<void(ClassUID)> unknownClass)
{
    Counted<RawData const> const buffer = stream.ReadAll();
    std::span<std::uint8_t const> const whole = buffer->GetSpan();
    if (whole.size() < sizeof(Magic) || !std::equal(Magic, Magic + sizeof(Magic), whole.begin())) {
        return nullptr;
    }
    String const source = stream.GetSourceName();
    if (whole.size() < StreamHeaderSize) {
        throw ArchiveCorruptionException(source, Format(LocalisedString("byte %1", "Damage"), 0),
                                         LocalisedString("the stream's header is cut off", "Damage"));
    }
    IDTag const rootTag(GetTag(whole.data() + 8));
    auto const format = GetNumber<std::uint16_t>(whole.data() + 4);
    if (FormatVersion < format) {
        throw FutureVersionException(source, ClassUID(rootTag.Value()), format, FormatVersion);
    }
    std::span<std::uint8_t const> const fields = whole.subspan(StreamHeaderSize);
    if (GetNumber<std::uint64_t>(whole.data() + 16) != fields.size()) {
        throw ArchiveCorruptionException(source, Format(LocalisedString("byte %1", "Damage"), 16),
                                         LocalisedString("the stream is not as long as it says", "Damage"));
    }
    TaggedStreamParser parser(whole, source, delayLoads == DelayLoadsBehaviour::CheckAll, progress, unknownClass);
    if (!parser.ParseFields(fields)) {
        return nullptr;
    }
    auto context = std::make_unique<Context>(buffer, store, source);
    context->m_Shared.resize(parser.GetShared().size());
    for (std::size_t i = 0; i < context->m_Shared.size(); ++i) {
        context->m_Shared[i].m_Payload = parser.GetShared()[i];
    }
    return Counted<InSerialiserFile>(
        new InSerialiserFile(std::move(context), fields, rootTag, GetNumber<std::uint16_t>(whole.data() + 6)));
}

}

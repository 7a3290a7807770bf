#include "framework/kernel/TaggedStreamParser.h"

#include "framework/kernel/ArchiveExceptions.h"
#include "framework/kernel/Format.h"

namespace Kernel
{

using namespace TaggedStream;

TaggedStreamParser::TaggedStreamParser(Bytes whole, String sourceName, bool checkVersions,
                                       std::function<bool(float)> const & progress,
                                       std::function<void(ClassUID)> const & unknownClass)
    : m_Whole(whole),
      m_SourceName(std::move(sourceName)),
      m_CheckVersions(checkVersions),
      m_Progress(progress),
      m_UnknownClass(unknownClass)
{
}

void TaggedStreamParser::Fail(std::uint8_t const * at, String const & fault) const
{
    throw ArchiveCorruptionException(m_SourceName, Format(LocalisedString("byte %1", "Damage"), at - m_Whole.data()), fault);
}

bool TaggedStreamParser::ParseFields(Bytes fields)
{
    // Reports go out between the fields of the root: those are what a long stream is made of.
    std::size_t const total = fields.size();
    while (!fields.empty()) {
        if (m_Progress && !m_Progress(static_cast<float>(total - fields.size()) / static_cast<float>(total))) {
            return false;
        }
        PropType type{};
        Bytes const payload = TakeField(fields, type);
        ParsePayload(type, payload, 0);
    }
    return !m_Progress || m_Progress(1.0f);
}

TaggedStreamParser::Bytes TaggedStreamParser::TakeField(Bytes & fields, PropType & type) const
{
    if (fields.size() < FieldHeaderSize) {
        Fail(fields.data(), LocalisedString("a field's header is cut off", "Damage"));
    }
    std::uint8_t const * const header = fields.data();
    auto const length = GetNumber<std::uint64_t>(header + 8);
    std::size_t const rest = fields.size() - FieldHeaderSize;
    // Compared before it is padded: padding a length near the top would wrap round.
    if (rest < length || rest < Padded(length)) {
        Fail(header, LocalisedString("a field is longer than what holds it", "Damage"));
    }
    type = static_cast<PropType>(header[4]);
    Bytes const payload = fields.subspan(FieldHeaderSize, length);
    fields = fields.subspan(FieldHeaderSize + Padded(length));
    return payload;
}

void TaggedStreamParser::ParseFieldsWithin(Bytes fields, int depth)
{
    while (!fields.empty()) {
        PropType type{};
        Bytes const payload = TakeField(fields, type);
        ParsePayload(type, payload, depth);
    }
}

void TaggedStreamParser::ParsePayload(PropType type, Bytes payload, int depth)
{
    if (std::size_t const fixed = FixedSize(type); fixed != 0 && fixed != payload.size()) {
        Fail(payload.data(), LocalisedString("a value has the wrong size for its type", "Damage"));
    }
    switch (type) {
    case PropType::Array: {
        std::uint64_t const size = payload.size() < 8 ? 0 : GetNumber<std::uint64_t>(payload.data());
        if (size == 0 || (payload.size() - 8) % size != 0) {
            Fail(payload.data(), LocalisedString("an array does not hold whole elements", "Damage"));
        }
        break;
    }
    case PropType::StringArray:
        ParseStringArray(payload);
        break;
    case PropType::Object:
        ParseObject(payload, depth);
        break;
    case PropType::ObjectArray:
        ParseObjectArray(payload, depth);
        break;
    case PropType::SharedObject:
        ParseSharedObject(payload, depth);
        break;
    default:
        // Scalars were looked at above; a type that is not known is left alone, and so is its content.
        break;
    }
}

void TaggedStreamParser::ParseStringArray(Bytes payload) const
{
    if (payload.size() < sizeof(std::uint64_t)) {
        Fail(payload.data(), LocalisedString("a list of texts has no count", "Damage"));
    }
    auto const count = GetNumber<std::uint64_t>(payload.data());
    std::uint64_t found = 0;
    std::size_t at = sizeof(std::uint64_t);
    while (at < payload.size()) {
        std::size_t const rest = payload.size() - at;
        if (rest < sizeof(std::uint32_t) ||
            rest - sizeof(std::uint32_t) < GetNumber<std::uint32_t>(payload.data() + at)) {
            Fail(payload.data() + at, LocalisedString("a text is longer than the list that holds it", "Damage"));
        }
        at += sizeof(std::uint32_t) + GetNumber<std::uint32_t>(payload.data() + at);
        ++found;
    }
    if (found != count) {
        Fail(payload.data(), LocalisedString("a list of texts does not hold as many as it says", "Damage"));
    }
}

void TaggedStreamParser::ParseObject(Bytes payload, int depth)
{
    if (payload.empty()) {
        return;
    }
    if (payload.size() < ObjectHeaderSize) {
        Fail(payload.data(), LocalisedString("an object's header is cut off", "Damage"));
    }
    if (MaximumDepth <= depth) {
        Fail(payload.data(), LocalisedString("objects lie too deep in each other", "Damage"));
    }
    if (m_CheckVersions || m_UnknownClass) {
        ClassUID const uid(GetTag(payload.data()));
        ClassProperties const * const properties = ClassProperties::Find(uid);
        auto const version = GetNumber<std::uint16_t>(payload.data() + 4);
        if (!properties) {
            if (m_UnknownClass) {
                m_UnknownClass(uid);
            }
        } else if (m_CheckVersions && properties->GetVersion() < version) {
            throw FutureVersionException(m_SourceName, uid, version, properties->GetVersion());
        }
    }
    ParseFieldsWithin(payload.subspan(ObjectHeaderSize), depth + 1);
}

void TaggedStreamParser::ParseObjectArray(Bytes payload, int depth)
{
    if (payload.size() < sizeof(std::uint64_t)) {
        Fail(payload.data(), LocalisedString("a list of objects has no count", "Damage"));
    }
    auto const count = GetNumber<std::uint64_t>(payload.data());
    Bytes elements = payload.subspan(sizeof(std::uint64_t));
    std::uint64_t found = 0;
    while (!elements.empty()) {
        std::uint8_t const * const at = elements.data();
        PropType type{};
        Bytes const element = TakeField(elements, type);
        if (type != PropType::Object) {
            Fail(at, LocalisedString("a list of objects holds something else", "Damage"));
        }
        ParseObject(element, depth);
        ++found;
    }
    if (found != count) {
        Fail(payload.data(), LocalisedString("a list of objects does not hold as many as it says", "Damage"));
    }
}

void TaggedStreamParser::ParseSharedObject(Bytes payload, int depth)
{
    if (payload.empty()) {
        return;
    }
    if (payload.size() < sizeof(std::uint64_t)) {
        Fail(payload.data(), LocalisedString("a shared value has no number", "Damage"));
    }
    auto const number = GetNumber<std::uint64_t>(payload.data());
    Bytes const object = payload.subspan(sizeof(std::uint64_t));
    if (object.empty()) {
        if (m_Shared.size() <= number) {
            Fail(payload.data(), LocalisedString("a shared value is referred to before it is there", "Damage"));
        }
        return;
    }
    if (number != m_Shared.size()) {
        Fail(payload.data(), LocalisedString("shared values are not numbered in their order", "Damage"));
    }
    m_Shared.push_back(object);
    ParseObject(object, depth);
}

}

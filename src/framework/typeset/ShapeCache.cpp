#include "framework/typeset/ShapeCache.h"

#include <unicode/uscript.h>

#include <mutex>

namespace Typeset
{

namespace
{

constexpr std::size_t largestCache = 48 * 1024 * 1024;
constexpr std::size_t mostStyles = 4096;

struct Pool
{
    std::mutex m_Lock;
    std::vector<std::unique_ptr<ShapeCache>> m_Idle;
};

Pool & GetPool()
{
    // Never destroyed: builders may be statics.
    static Pool & pool = *new Pool;
    return pool;
}

}

void FaceCoverage::Fill(std::size_t page)
{
    auto block = std::make_unique<std::array<std::uint64_t, 4>>();
    for (std::size_t i = 0; i < 256; ++i) {
        if (m_Face.HasGlyph(static_cast<char32_t>(page * 256 + i))) {
            (*block)[i / 64] |= std::uint64_t{1} << i % 64;
        }
    }
    m_Blocks[page] = std::move(block);
}

ShapeCache::ShapeCache() : m_Buffer(hb_buffer_create()), m_Bidi(ubidi_open()) {}

ShapeCache::~ShapeCache()
{
    m_Styles.clear();
    m_Contexts.clear();
    hb_buffer_destroy(m_Buffer);
    ubidi_close(m_Bidi);
    if (m_CharacterIterator) {
        ubrk_close(m_CharacterIterator);
    }
    for (auto const & [language, iterator] : m_LineIterators) {
        ubrk_close(iterator);
    }
}

std::unique_ptr<ShapeCache> ShapeCache::Borrow()
{
    Pool & pool = GetPool();
    {
        std::lock_guard const guard(pool.m_Lock);
        if (!pool.m_Idle.empty()) {
            std::unique_ptr<ShapeCache> cache = std::move(pool.m_Idle.back());
            pool.m_Idle.pop_back();
            return cache;
        }
    }
    return std::make_unique<ShapeCache>();
}

void ShapeCache::GiveBack(std::unique_ptr<ShapeCache> cache)
{
    Pool & pool = GetPool();
    std::lock_guard const guard(pool.m_Lock);
    pool.m_Idle.push_back(std::move(cache));
}

void ShapeCache::DropIdle()
{
    Pool & pool = GetPool();
    std::vector<std::unique_ptr<ShapeCache>> idle;
    std::lock_guard const guard(pool.m_Lock);
    idle.swap(pool.m_Idle);
}

ResolvedStyle & ShapeCache::Resolve(Kernel::Counted<TextStyle const> const & style)
{
    std::unique_ptr<ResolvedStyle> & known = m_Styles[style.Get()];
    if (!known) {
        known = std::make_unique<ResolvedStyle>(style, *this);
    }
    return *known;
}

ShapingContext & ShapeCache::GetContext(Kernel::Counted<FontFace const> const & face,
                                        std::vector<hb_feature_t> const & features, std::uint8_t script,
                                        String const & language, bool rightToLeft)
{
    std::string const featureKey(reinterpret_cast<char const *>(features.data()),
                                 features.size() * sizeof(hb_feature_t));
    std::unique_ptr<ShapingContext> & known =
        m_Contexts[{face.Get(), featureKey, script, language.ToStd(), rightToLeft}];
    if (!known) {
        hb_language_t const hbLanguage = hb_language_from_string(language.c_str(), static_cast<int>(language.Length()));
        hb_script_t const hbScript =
            hb_script_from_string(uscript_getShortName(static_cast<UScriptCode>(script)), -1);
        known = std::make_unique<ShapingContext>(face, features, hbScript, hbLanguage, rightToLeft, m_Buffer);
    }
    return *known;
}

FaceCoverage & ShapeCache::GetCoverage(Kernel::Counted<FontFace const> const & face)
{
    std::unique_ptr<FaceCoverage> & known = m_Coverages[face.Get()];
    if (!known) {
        known = std::make_unique<FaceCoverage>(*face);
    }
    return *known;
}

UBreakIterator * ShapeCache::GetLineIterator(String const & language)
{
    auto const [place, isNew] = m_LineIterators.try_emplace(language.ToStd(), nullptr);
    if (isNew) {
        UErrorCode error = U_ZERO_ERROR;
        place->second = ubrk_open(UBRK_LINE, language.c_str(), nullptr, 0, &error);
        if (U_FAILURE(error)) {
            error = U_ZERO_ERROR;
            place->second = ubrk_open(UBRK_LINE, "", nullptr, 0, &error);
        }
    }
    return place->second;
}

UBreakIterator * ShapeCache::GetCharacterIterator()
{
    if (!m_CharacterIterator) {
        UErrorCode error = U_ZERO_ERROR;
        m_CharacterIterator = ubrk_open(UBRK_CHARACTER, "", nullptr, 0, &error);
    }
    return m_CharacterIterator;
}

void ShapeCache::Trim()
{
    std::size_t size = 0;
    for (auto const & [key, context] : m_Contexts) {
        size += context->GetCacheSize();
    }
    if (size > largestCache || m_Styles.size() > mostStyles) {
        m_Styles.clear();
        m_Contexts.clear();
    }
}

}

#include "framework/raster/Resample.h"

#include "framework/kernel/Assert.h"
#include "framework/raster/PixelConversion.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>

namespace Raster
{

namespace
{

/// Sums of weighted colours: exact enough to give a constant back as it was.
template <typename T>
using SumOf = std::conditional_t<sizeof(T) == 1, float, double>;

/// What counts as opaque.
template <typename T>
constexpr SumOf<T> Most = std::is_floating_point_v<T> ? SumOf<T>(1) : SumOf<T>(std::numeric_limits<T>::max());

template <typename T, typename Sum>
T Rounded(Sum value)
{
    if constexpr (std::is_floating_point_v<T>) {
        return static_cast<T>(value);
    } else {
        return static_cast<T>(std::clamp(value, Sum(0), Most<T>) + Sum(0.5));
    }
}

/// The pixels of a line of the bitmap that make one pixel of the buffer. The weights add up to how much of that pixel
/// the bitmap covers.
template <typename Sum>
struct Taps
{
    int m_First = 0;
    std::vector<Sum> m_Weights;
};

/// For pixel i of the buffer, which lies from `origin + i * step` to the next one's place in a line of `size` pixels.
template <typename Sum>
std::vector<Taps<Sum>> TapsOf(int count, double origin, double step, int size)
{
    std::vector<Taps<Sum>> all(static_cast<std::size_t>(count));
    double const extent = std::abs(step);
    for (int i = 0; i < count; ++i) {
        double const low = origin + step * i + std::min(step, 0.0);
        double const high = low + extent;
        double const from = std::max(low, 0.0);
        double const to = std::min(high, static_cast<double>(size));
        if (!(from < to)) {
            continue;
        }
        Taps<Sum> & taps = all[static_cast<std::size_t>(i)];
        std::vector<double> weights;
        if (extent > 1) {
            taps.m_First = static_cast<int>(from);
            for (int pixel = taps.m_First; pixel < to; ++pixel) {
                weights.push_back(std::min(to, pixel + 1.0) - std::max(from, static_cast<double>(pixel)));
            }
        } else {
            double const place = std::clamp((low + high) / 2 - 0.5, 0.0, size - 1.0);
            taps.m_First = static_cast<int>(place);
            double const part = place - taps.m_First;
            weights.push_back(1 - part);
            if (part > 0) {
                weights.push_back(part);
            }
        }
        double sum = 0;
        for (double const weight : weights) {
            sum += weight;
        }
        // Coordinates that rounding has moved a little still cover the whole pixel.
        double const covered = (to - from) / extent;
        double const scale = (covered > 1 - 1e-6 ? 1 : covered) / sum;
        for (double const weight : weights) {
            taps.m_Weights.push_back(static_cast<Sum>(weight * scale));
        }
    }
    return all;
}

/// Puts a premultiplied colour over a pixel. `sums` holds the channels, alpha last, in the format's own range.
template <typename T>
void PutOver(SumOf<T> const * sums, std::size_t channels, std::uint8_t * target)
{
    using Sum = SumOf<T>;
    Sum const alpha = sums[channels - 1];
    if (!(alpha > 0)) {
        return;
    }
    T pixel[5];
    std::memcpy(pixel, target, channels * sizeof(T));
    Sum const rest = std::max(Sum(0), 1 - alpha / Most<T>) * static_cast<Sum>(pixel[channels - 1]);
    Sum const whole = alpha + rest;
    for (std::size_t i = 0; i + 1 < channels; ++i) {
        pixel[i] = Rounded<T>((sums[i] + static_cast<Sum>(pixel[i]) * rest) / whole);
    }
    pixel[channels - 1] = Rounded<T>(whole);
    std::memcpy(target, pixel, channels * sizeof(T));
}

/// Adds a weighted pixel of the bitmap, premultiplied, to the sums.
template <typename T>
void AddPixel(std::uint8_t const * source, std::size_t channels, SumOf<T> weight, SumOf<T> * sums)
{
    T pixel[5];
    std::memcpy(pixel, source, channels * sizeof(T));
    SumOf<T> const alpha = static_cast<SumOf<T>>(pixel[channels - 1]) * weight;
    // Most of a page is empty paper.
    if (alpha == 0) {
        return;
    }
    for (std::size_t i = 0; i + 1 < channels; ++i) {
        sums[i] += static_cast<SumOf<T>>(pixel[i]) * alpha;
    }
    sums[channels - 1] += alpha;
}

/// Without rotation lines and columns are weighed one after the other.
template <typename T>
void ResampleStraight(DynamicBitmap const & bitmap, AffineTransform::Params const & toSource, DynamicBase & buffer)
{
    using Sum = SumOf<T>;
    std::size_t const channels = static_cast<std::size_t>(ChannelCount(bitmap.GetFormat()));
    auto const columns = TapsOf<Sum>(buffer.GetWidth(), toSource.e, toSource.a, bitmap.GetWidth());
    auto const rows = TapsOf<Sum>(buffer.GetHeight(), toSource.f, toSource.d, bitmap.GetHeight());
    std::size_t const size = columns.size() * channels;
    // The two rows used last, brought to the buffer's width: neighbouring rows of the buffer share them.
    struct Line
    {
        int m_Row = -1;
        std::vector<Sum> m_Sums;
    };
    Line lines[2];
    auto const lineOf = [&](int row) -> std::vector<Sum> const & {
        Line & line = lines[row & 1];
        if (line.m_Row != row) {
            line.m_Row = row;
            line.m_Sums.assign(size, 0);
            std::uint8_t const * const pixels = bitmap.GetRow(row);
            for (std::size_t x = 0; x < columns.size(); ++x) {
                std::uint8_t const * pixel = pixels + static_cast<std::size_t>(columns[x].m_First) * channels * sizeof(T);
                for (Sum const weight : columns[x].m_Weights) {
                    AddPixel<T>(pixel, channels, weight, line.m_Sums.data() + x * channels);
                    pixel += channels * sizeof(T);
                }
            }
        }
        return line.m_Sums;
    };
    std::vector<Sum> sums(size);
    for (int y = 0; y < buffer.GetHeight(); ++y) {
        Taps<Sum> const & taps = rows[static_cast<std::size_t>(y)];
        std::fill(sums.begin(), sums.end(), Sum(0));
        for (std::size_t j = 0; j < taps.m_Weights.size(); ++j) {
            std::vector<Sum> const & line = lineOf(taps.m_First + static_cast<int>(j));
            for (std::size_t i = 0; i < size; ++i) {
                sums[i] += line[i] * taps.m_Weights[j];
            }
        }
        for (std::size_t x = 0; x < columns.size(); ++x) {
            PutOver<T>(sums.data() + x * channels, channels, buffer.GetRow(y) + x * channels * sizeof(T));
        }
    }
}

/// Any transform: each pixel is looked at in a grid of places close enough to miss none of the bitmap's pixels.
template <typename T>
void ResampleTurned(DynamicBitmap const & bitmap, AffineTransform::Params const & toSource, DynamicBase & buffer)
{
    using Sum = SumOf<T>;
    static constexpr double mostPlaces = 16;
    std::size_t const channels = static_cast<std::size_t>(ChannelCount(bitmap.GetFormat()));
    auto const placesFor = [](double x, double y) {
        return static_cast<int>(std::clamp(std::ceil(std::hypot(x, y)), 1.0, mostPlaces));
    };
    int const across = placesFor(toSource.a, toSource.b);
    int const down = placesFor(toSource.c, toSource.d);
    auto const add = [&](int x, int y, double weight, Sum * sums) {
        if (0 <= x && x < bitmap.GetWidth() && 0 <= y && y < bitmap.GetHeight()) {
            AddPixel<T>(bitmap.GetRow(y) + static_cast<std::size_t>(x) * channels * sizeof(T), channels,
                        static_cast<Sum>(weight), sums);
        }
    };
    for (int y = 0; y < buffer.GetHeight(); ++y) {
        for (int x = 0; x < buffer.GetWidth(); ++x) {
            Sum sums[5] = {};
            for (int place = 0; place < across * down; ++place) {
                Kernel::Point const point = toSource.Map({x + (place % across + 0.5) / across,
                                                          y + (place / across + 0.5) / down});
                if (!(point.x > -1 && point.y > -1 && point.x < bitmap.GetWidth() + 1 &&
                      point.y < bitmap.GetHeight() + 1)) {
                    continue;
                }
                double const left = std::floor(point.x - 0.5);
                double const top = std::floor(point.y - 0.5);
                double const right = point.x - 0.5 - left;
                double const bottom = point.y - 0.5 - top;
                double const share = 1.0 / (across * down);
                int const column = static_cast<int>(left);
                int const row = static_cast<int>(top);
                add(column, row, (1 - right) * (1 - bottom) * share, sums);
                add(column + 1, row, right * (1 - bottom) * share, sums);
                add(column, row + 1, (1 - right) * bottom * share, sums);
                add(column + 1, row + 1, right * bottom * share, sums);
            }
            PutOver<T>(sums, channels, buffer.GetRow(y) + static_cast<std::size_t>(x) * channels * sizeof(T));
        }
    }
}

template <typename T>
void ResampleAs(DynamicBitmap const & bitmap, AffineTransform::Params const & toSource, DynamicBase & buffer)
{
    if (toSource.b == 0 && toSource.c == 0) {
        ResampleStraight<T>(bitmap, toSource, buffer);
    } else {
        ResampleTurned<T>(bitmap, toSource, buffer);
    }
}

}

void Resample(DynamicBitmap const & bitmap, AffineTransform::Params const & toSource, DynamicBase & buffer)
{
    double const determinant = toSource.Determinant();
    if (bitmap.GetPixels().empty() || determinant == 0 || !std::isfinite(determinant)) {
        return;
    }
    if (bitmap.GetFormat() != buffer.GetFormat()) {
        DynamicBitmap converted;
        converted.Create(bitmap.GetWidth(), bitmap.GetHeight(), buffer.GetFormat(), bitmap.GetMipmapMode(),
                         bitmap.GetHardwareCachePolicy());
        ConvertPixels(bitmap, converted);
        Resample(converted, toSource, buffer);
        return;
    }
    switch (BytesPerChannel(buffer.GetFormat())) {
    case 1:
        ResampleAs<std::uint8_t>(bitmap, toSource, buffer);
        break;
    case 2:
        ResampleAs<std::uint16_t>(bitmap, toSource, buffer);
        break;
    default:
        ResampleAs<float>(bitmap, toSource, buffer);
        break;
    }
}

Kernel::Counted<DynamicBitmap> Reduce(DynamicBitmap const & bitmap, int width, int height)
{
    KORVANE_ASSERT(width >= 1 && height >= 1 && width <= bitmap.GetWidth() && height <= bitmap.GetHeight());
    Kernel::Counted<DynamicBitmap> reduced = Kernel::MakeCounted<DynamicBitmap>();
    reduced->Create(width, height, bitmap.GetFormat(), bitmap.GetMipmapMode(), bitmap.GetHardwareCachePolicy());
    Resample(bitmap,
             AffineTransform::Params::Scale(static_cast<double>(bitmap.GetWidth()) / width,
                                            static_cast<double>(bitmap.GetHeight()) / height),
             *reduced);
    return reduced;
}

}

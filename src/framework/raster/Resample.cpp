#include "framework/raster/Resample.h"

#include "framework/kernel/Assert.h"

#include <algorithm>
#include <cmath>
#include <cstring>

namespace Raster
{

namespace
{

template <typename T>
T Rounded(double value)
{
    if constexpr (std::is_floating_point_v<T>) {
        return static_cast<T>(value);
    } else {
        return static_cast<T>(std::lround(value));
    }
}

/// How much of the pixels of a line one target pixel covers.
struct Coverage
{
    int m_First;
    std::vector<double> m_Weights;
};

std::vector<Coverage> CoveragesOf(int source, int target)
{
    std::vector<Coverage> coverages;
    double const step = static_cast<double>(source) / target;
    for (int i = 0; i < target; ++i) {
        double const from = i * step;
        double const to = std::min((i + 1) * step, static_cast<double>(source));
        Coverage coverage{static_cast<int>(from), {}};
        for (int pixel = coverage.m_First; pixel < to; ++pixel) {
            coverage.m_Weights.push_back(std::min(to, pixel + 1.0) - std::max(from, static_cast<double>(pixel)));
        }
        coverages.push_back(std::move(coverage));
    }
    return coverages;
}

template <typename T>
void ReduceChannels(DynamicBitmap const & source, DynamicBitmap & target)
{
    std::size_t const channels = static_cast<std::size_t>(ChannelCount(source.GetFormat()));
    std::vector<Coverage> const columns = CoveragesOf(source.GetWidth(), target.GetWidth());
    std::vector<Coverage> const rows = CoveragesOf(source.GetHeight(), target.GetHeight());
    std::vector<double> sums(columns.size() * channels);
    for (int y = 0; y < target.GetHeight(); ++y) {
        Coverage const & row = rows[static_cast<std::size_t>(y)];
        std::fill(sums.begin(), sums.end(), 0.0);
        double height = 0;
        for (std::size_t j = 0; j < row.m_Weights.size(); ++j) {
            std::uint8_t const * const bytes = source.GetRow(row.m_First + static_cast<int>(j));
            height += row.m_Weights[j];
            for (std::size_t x = 0; x < columns.size(); ++x) {
                double * const sum = sums.data() + x * channels;
                for (std::size_t i = 0; i < columns[x].m_Weights.size(); ++i) {
                    T pixel[5];
                    std::memcpy(pixel, bytes + (static_cast<std::size_t>(columns[x].m_First) + i) * channels * sizeof(T),
                                channels * sizeof(T));
                    double const alpha = static_cast<double>(pixel[channels - 1]) * columns[x].m_Weights[i] *
                                         row.m_Weights[j];
                    for (std::size_t c = 0; c + 1 < channels; ++c) {
                        sum[c] += static_cast<double>(pixel[c]) * alpha;
                    }
                    sum[channels - 1] += alpha;
                }
            }
        }
        for (std::size_t x = 0; x < columns.size(); ++x) {
            double width = 0;
            for (double const weight : columns[x].m_Weights) {
                width += weight;
            }
            double const * const sum = sums.data() + x * channels;
            double const alpha = sum[channels - 1];
            T pixel[5] = {};
            for (std::size_t c = 0; alpha > 0 && c + 1 < channels; ++c) {
                pixel[c] = Rounded<T>(sum[c] / alpha);
            }
            pixel[channels - 1] = Rounded<T>(alpha / (width * height));
            std::memcpy(target.GetRow(y) + x * channels * sizeof(T), pixel, channels * sizeof(T));
        }
    }
}

}

Kernel::Counted<DynamicBitmap> Reduce(DynamicBitmap const & bitmap, int width, int height)
{
    KORVANE_ASSERT(width >= 1 && height >= 1 && width <= bitmap.GetWidth() && height <= bitmap.GetHeight());
    Kernel::Counted<DynamicBitmap> reduced = Kernel::MakeCounted<DynamicBitmap>();
    reduced->Create(width, height, bitmap.GetFormat(), bitmap.GetMipmapMode(), bitmap.GetHardwareCachePolicy());
    switch (BytesPerChannel(bitmap.GetFormat())) {
    case 1:
        ReduceChannels<std::uint8_t>(bitmap, *reduced);
        break;
    case 2:
        ReduceChannels<std::uint16_t>(bitmap, *reduced);
        break;
    default:
        ReduceChannels<float>(bitmap, *reduced);
        break;
    }
    return reduced;
}

}

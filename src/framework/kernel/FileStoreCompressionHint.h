#pragma once

#include "framework/kernel/Countable.h"

namespace Kernel
{

/// What a predictor does to the bytes before they are compressed.
enum class CompressionPredictorType
{
    None = 0,
};

/// How an item of a store wants to be compressed.
class FileStoreCompressionHint : public virtual Countable
{
public:
    /// Deflate's level from 1 to 9; 0 stores the bytes as they are.
    [[nodiscard]] virtual int GetDeflateLevel() const = 0;
};

/// The hint for content of no special kind.
class FileStoreCompressionHintGeneral : public FileStoreCompressionHint
{
public:
    enum class CompressionLevel
    {
        /// As they are: for what is compressed already, or read more often than it is worth.
        Stored = 0,
        Fast = 1,
        Normal = 2,
        Best = 3,
    };

    /// `predictorStride` is the bytes of one element for the predictor; 0 without one.
    FileStoreCompressionHintGeneral(CompressionLevel level, CompressionPredictorType predictor, int predictorStride)
        : m_Level(level),
          m_Predictor(predictor),
          m_PredictorStride(predictorStride)
    {
    }

    [[nodiscard]] CompressionPredictorType GetPredictor() const { return m_Predictor; }
    [[nodiscard]] int GetPredictorStride() const { return m_PredictorStride; }
    [[nodiscard]] int GetDeflateLevel() const override
    {
        switch (m_Level) {
        case CompressionLevel::Stored:
            return 0;
        case CompressionLevel::Fast:
            return 1;
        case CompressionLevel::Normal:
            return 6;
        case CompressionLevel::Best:
            return 9;
        }
        return 6;
    }

private:
    CompressionLevel const m_Level;
    CompressionPredictorType const m_Predictor;
    int const m_PredictorStride;
};

}

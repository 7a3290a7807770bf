#pragma once

#include <cstdint>
#include <vector>

#include "framework/kernel/Geometry.h"

namespace Renderer
{

/// What is inside of a path that crosses itself.
enum class FillRule : std::uint8_t
{
    NonZero,
    EvenOdd,
};

/// Lines and cubic curves, in points, y down.
class Path
{
public:
    enum class Verb : std::uint8_t
    {
        Move,  ///< One point.
        Line,  ///< One point.
        Curve, ///< Two control points and the end.
        Close, ///< None.
    };

    void MoveTo(double x, double y) { Add(Verb::Move, x, y); }
    void LineTo(double x, double y) { Add(Verb::Line, x, y); }
    void CurveTo(double x1, double y1, double x2, double y2, double x, double y);
    void Close() { m_Verbs.push_back(Verb::Close); }
    void AddRect(Kernel::Rect const & rect);
    void AddEllipse(Kernel::Rect const & bounds);

    [[nodiscard]] bool IsEmpty() const { return m_Verbs.empty(); }
    [[nodiscard]] std::vector<Verb> const & GetVerbs() const { return m_Verbs; }
    /// The points of all verbs in order.
    [[nodiscard]] std::vector<Kernel::Point> const & GetPoints() const { return m_Points; }

    [[nodiscard]] static Path Rectangle(Kernel::Rect const & rect)
    {
        Path path;
        path.AddRect(rect);
        return path;
    }
    [[nodiscard]] static Path Segment(Kernel::Point const & from, Kernel::Point const & to)
    {
        Path path;
        path.MoveTo(from.x, from.y);
        path.LineTo(to.x, to.y);
        return path;
    }

private:
    void Add(Verb verb, double x, double y)
    {
        m_Verbs.push_back(verb);
        m_Points.push_back({x, y});
    }

    std::vector<Verb> m_Verbs;
    std::vector<Kernel::Point> m_Points;
};

enum class LineCap : std::uint8_t
{
    Butt = 0,
    Round = 1,
    Square = 2,
};

enum class LineJoin : std::uint8_t
{
    Miter = 0,
    Round = 1,
    Bevel = 2,
};

/// How a path is stroked. Lengths in points.
struct Stroke
{
    double m_Width = 1;
    LineCap m_Cap = LineCap::Butt;
    LineJoin m_Join = LineJoin::Miter;
    double m_MiterLimit = 10;
    /// Lengths of dashes and gaps in turn; empty is a solid line.
    std::vector<double> m_Dashes;
    double m_DashPhase = 0;
};

}

#include "platform/views/LayoutEngine.h"

#include "platform/views/View.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <optional>

namespace platform {

namespace {

enum Part : std::size_t { X, Y, Width, Height, PartCount };

constexpr double kNoise = 1e-9;

/// sum of factors × unknowns = constant.
struct Equation {
    std::vector<double> factors;
    double constant = 0;
};

/// Equations that do not contradict each other, kept reduced: each has an unknown that stands in no other.
class System {
public:
    explicit System(std::size_t unknowns) : m_unknowns(unknowns) {}

    Equation emptyEquation() const { return {std::vector<double>(m_unknowns, 0.0), 0}; }

    /// Ignores an equation that those taken before already settle, whether it agrees with them or not.
    void take(Equation equation)
    {
        for (const Row& row : m_rows)
            subtract(equation, row.equation, equation.factors[row.pivot]);
        const auto largest = std::max_element(equation.factors.begin(), equation.factors.end(),
                                              [](double a, double b) { return std::abs(a) < std::abs(b); });
        if (largest == equation.factors.end() || std::abs(*largest) < kNoise)
            return;
        const auto pivot = static_cast<std::size_t>(largest - equation.factors.begin());
        const double scale = *largest;
        for (double& factor : equation.factors)
            factor /= scale;
        equation.constant /= scale;
        for (Row& row : m_rows)
            subtract(row.equation, equation, row.equation.factors[pivot]);
        m_rows.push_back({std::move(equation), pivot});
    }

    /// Once every unknown is settled.
    std::vector<double> solution() const
    {
        std::vector<double> values(m_unknowns, 0.0);
        for (const Row& row : m_rows)
            values[row.pivot] = row.equation.constant;
        return values;
    }

private:
    struct Row {
        Equation equation;
        std::size_t pivot;
    };

    static void subtract(Equation& from, const Equation& what, double times)
    {
        if (times == 0)
            return;
        for (std::size_t i = 0; i < from.factors.size(); ++i)
            from.factors[i] -= times * what.factors[i];
        from.constant -= times * what.constant;
    }

    std::size_t m_unknowns;
    std::vector<Row> m_rows;
};

/// An attribute as a sum of a frame's parts.
struct Term {
    Part part;
    double factor;
};

std::vector<Term> terms(LayoutAttribute attribute)
{
    switch (attribute) {
    case LayoutAttribute::Leading:
        return {{X, 1}};
    case LayoutAttribute::Trailing:
        return {{X, 1}, {Width, 1}};
    case LayoutAttribute::CenterX:
        return {{X, 1}, {Width, 0.5}};
    case LayoutAttribute::Top:
        return {{Y, 1}};
    case LayoutAttribute::Bottom:
        return {{Y, 1}, {Height, 1}};
    case LayoutAttribute::CenterY:
        return {{Y, 1}, {Height, 0.5}};
    case LayoutAttribute::Width:
        return {{Width, 1}};
    case LayoutAttribute::Height:
        return {{Height, 1}};
    case LayoutAttribute::None:
        break;
    }
    return {};
}

double partOf(base::Rect rect, Part part)
{
    switch (part) {
    case X:
        return rect.minX();
    case Y:
        return rect.minY();
    case Width:
        return rect.width();
    default:
        return rect.height();
    }
}

class Solver {
public:
    Solver(View& owner, const std::vector<LayoutConstraint>& constraints) : m_owner(owner)
    {
        for (const auto& view : owner.subviews()) {
            const bool concerned =
                std::any_of(constraints.begin(), constraints.end(),
                            [&](const LayoutConstraint& constraint) { return constraint.refersTo(*view); });
            if (concerned && !view->translatesAutoresizingMaskIntoConstraints())
                m_views.push_back(view);
        }
    }

    void run(const std::vector<LayoutConstraint>& constraints)
    {
        if (m_views.empty())
            return;
        System system(m_views.size() * PartCount);
        for (auto constraint = constraints.rbegin(); constraint != constraints.rend(); ++constraint)
            if (auto equation = equationOf(*constraint, system.emptyEquation()))
                system.take(std::move(*equation));
        for (const auto& parts : {std::pair(Width, Height), std::pair(X, Y)})
            for (std::size_t i = 0; i < m_views.size(); ++i)
                for (const Part part : {parts.first, parts.second}) {
                    Equation stay = system.emptyEquation();
                    stay.factors[i * PartCount + part] = 1;
                    stay.constant = partOf(m_views[i]->frame(), part);
                    system.take(std::move(stay));
                }
        place(system.solution());
    }

private:
    std::optional<Equation> equationOf(const LayoutConstraint& constraint, Equation equation) const
    {
        const auto first = constraint.first.lock();
        const auto second = constraint.second.lock();
        if (!first || !add(equation, *first, constraint.firstAttribute, 1))
            return std::nullopt;
        if (!second && constraint.secondAttribute != LayoutAttribute::None)
            return std::nullopt; // its view is gone
        if (second && !add(equation, *second, constraint.secondAttribute, -constraint.multiplier))
            return std::nullopt;
        equation.constant += constraint.constant;
        return equation;
    }

    /// False for a view that is not in the owner's tree.
    bool add(Equation& equation, const View& view, LayoutAttribute attribute, double times) const
    {
        if (!view.isDescendantOf(m_owner))
            return false;
        const auto unknown = std::find_if(m_views.begin(), m_views.end(),
                                          [&](const std::shared_ptr<View>& each) { return each.get() == &view; });
        for (const Term& term : terms(attribute)) {
            if (unknown != m_views.end())
                equation.factors[static_cast<std::size_t>(unknown - m_views.begin()) * PartCount + term.part] +=
                    times * term.factor;
            else
                equation.constant -= times * term.factor * partOf(rectInOwner(view), term.part);
        }
        return true;
    }

    base::Rect rectInOwner(const View& view) const
    {
        base::Rect rect = view.bounds();
        for (const View* each = &view; each != &m_owner; each = each->superview().get()) {
            rect.origin.x += each->frame().minX();
            rect.origin.y += each->frame().minY();
        }
        return rect;
    }

    void place(const std::vector<double>& values)
    {
        for (std::size_t i = 0; i < m_views.size(); ++i) {
            const auto value = [&](Part part) { return withoutNoise(values[i * PartCount + part]); };
            m_views[i]->setFrame(
                base::Rect::make(value(X), value(Y), std::max(0.0, value(Width)), std::max(0.0, value(Height))));
        }
    }

    View& m_owner;
    std::vector<std::shared_ptr<View>> m_views; ///< whose frames are the unknowns
};

} // namespace

double withoutNoise(double value)
{
    // A power of two, so that the result is exact. Adding zero turns a negative zero into a plain one.
    constexpr double kGrid = 1 << 20;
    return std::round(value * kGrid) / kGrid + 0.0;
}

void solveConstraints(View& owner, const std::vector<LayoutConstraint>& constraints)
{
    Solver(owner, constraints).run(constraints);
}

} // namespace platform

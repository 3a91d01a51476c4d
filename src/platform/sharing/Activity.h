/// One thing that can be done with what is shared: an entry of the share sheet. Main queue only.
///
/// In this order: it is asked whether it can be performed with the items; when the user picks it, it is prepared with
/// them, and then either its view controller is shown or, without one, it is performed. It ends once, whenever it calls
/// activityDidFinish or activityDidFail; whoever performs it may let go of it then, or begin again: after an error, say.
#pragma once

#include "base/Error.h"
#include "platform/sharing/ShareItem.h"
#include "platform/views/Image.h"
#include "platform/views/ViewController.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>

namespace platform {

class Activity : public runtime::Object {
public:
    enum class Category { Action = 0, Share = 1 };

    struct End {
        bool completed = false; ///< whether the receiver took what was shared
        base::ErrorRef error;   ///< why not, for the user to read; null when the user wanted it so
    };

    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    /// The name under which the host hears of it.
    virtual std::string activityType() const = 0;
    /// In the user's language: "Mail", or a device's name.
    virtual std::string activityTitle() const = 0;
    /// A glyph of the presenter's icon set, shown where there is no image.
    virtual std::string glyph() const { return {}; }
    virtual ImageRef activityImage() const { return nullptr; }

    virtual bool canPerformWithActivityItems(const ShareItems& /*items*/) const { return true; }
    virtual void prepareWithActivityItems(const ShareItems& /*items*/) {}
    /// What to show in place of performing it; none by default.
    virtual std::shared_ptr<ViewController> activityViewController() { return nullptr; }
    virtual void performActivity() {}
    /// Gives up what performActivity() began; it ends soon, not completed unless that came first.
    virtual void cancel() {}

    /// With whom it was shared, or where what was made lies, as far as that is known by its end: a device's name, a path.
    virtual std::string receiver() const { return {}; }

    /// It is over. Only the first end counts, until it is performed again.
    void activityDidFinish(bool completed);
    /// The same, not completed, with what the user has to know. The error carries a message for people.
    void activityDidFail(base::ErrorRef error);

    // For whoever performs it, each time anew.
    void setEndHandler(std::function<void(const End&)> handler);
    /// `progress` from 0 to 1, nothing while that is not known.
    void setProgressHandler(std::function<void(std::optional<double> progress)> handler)
    {
        here(m_progressHandler) = std::move(handler);
    }

protected:
    void noteProgress(std::optional<double> progress) const;

private:
    void end(const End& how);

    std::function<void(const End&)> m_endHandler;
    std::function<void(std::optional<double>)> m_progressHandler;
};

} // namespace platform

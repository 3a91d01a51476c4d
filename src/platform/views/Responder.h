/// Whatever takes part in the chain along which events travel: views, their controllers, the window. Main queue only.
#pragma once

#include "runtime/Object.h"

#include <memory>
#include <vector>

namespace platform {

class Window;

enum class MotionSubtype { None, Shake };

struct MotionEvent {
    MotionSubtype subtype = MotionSubtype::None;
};

/// Keys by meaning, not by place on the keyboard.
enum class Key { Space, Escape, Return, Left, Right, Up, Down, Home, End, Comma, Period, Character };

/// A key that a responder answers while it stands in the chain of the first responder.
struct KeyCommand {
    Key key = Key::Character;
    char character = 0; ///< for Key::Character: a lower-case letter
    bool control = false;
    runtime::Selector action;
    bool shift = false; ///< counts only together with control
};

class Responder : public runtime::Object {
public:
    static const runtime::Class& classObject();
    const runtime::Class& isa() const override;

    /// Who gets what this one does not handle; null at the end of the chain.
    virtual std::shared_ptr<Responder> nextResponder() const = 0;
    /// Null outside a window.
    virtual std::shared_ptr<Window> window() const = 0;

    virtual bool canBecomeFirstResponder() const { return false; }
    /// False when it cannot be, or when it is in no window.
    bool becomeFirstResponder();
    void resignFirstResponder();
    bool isFirstResponder() const;

    /// By default handed to the next responder.
    virtual void motionEnded_withEvent(MotionSubtype motion, const MotionEvent& event);

    virtual std::vector<KeyCommand> keyCommands() const { return {}; }
};

} // namespace platform

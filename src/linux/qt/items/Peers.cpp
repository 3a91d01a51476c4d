// Which peer shows which kind of view.
#include "linux/qt/items/BackdropItem.h"
#include "linux/qt/items/ButtonItem.h"
#include "linux/qt/items/ImageItem.h"
#include "linux/qt/items/LabelItem.h"
#include "linux/qt/items/RowItem.h"
#include "linux/qt/items/ScrubberItem.h"
#include "linux/qt/items/ScrubberPartItems.h"
#include "linux/qt/items/SurfaceItem.h"
#include "linux/qt/items/ToolbarItem.h"
#include "platform/views/BackdropView.h"
#include "platform/views/Button.h"
#include "platform/views/ImageView.h"
#include "platform/views/Label.h"
#include "platform/views/ListRow.h"
#include "platform/views/MovieScrubber.h"
#include "platform/views/SurfaceView.h"
#include "platform/views/Toolbar.h"

namespace qtui {

std::unique_ptr<ViewItem> makePeer(const std::shared_ptr<platform::View>& view, Stage& stage)
{
    if (dynamic_cast<platform::Label*>(view.get()))
        return std::make_unique<LabelItem>(view, stage);
    if (dynamic_cast<platform::ListRow*>(view.get())) // a button, too
        return std::make_unique<RowItem>(view, stage);
    if (dynamic_cast<platform::SurfaceView*>(view.get()))
        return std::make_unique<SurfaceItem>(view, stage);
    if (dynamic_cast<platform::Button*>(view.get()))
        return std::make_unique<ButtonItem>(view, stage);
    if (dynamic_cast<platform::MovieScrubber*>(view.get()))
        return std::make_unique<ScrubberItem>(view, stage);
    if (dynamic_cast<platform::PlayHeadView*>(view.get()))
        return std::make_unique<PlayHeadItem>(view, stage);
    if (dynamic_cast<platform::TrimFrameView*>(view.get()))
        return std::make_unique<TrimFrameItem>(view, stage);
    if (dynamic_cast<platform::Toolbar*>(view.get()))
        return std::make_unique<ToolbarItem>(view, stage);
    if (dynamic_cast<platform::ImageView*>(view.get()))
        return std::make_unique<ImageItem>(view, stage);
    if (dynamic_cast<platform::BackdropView*>(view.get()))
        return std::make_unique<BackdropItem>(view, stage);
    return std::make_unique<ViewItem>(view, stage);
}

} // namespace qtui

// The screenshot functions of the GUI modules, called in this order. A
// module adds its declaration and its entry in kShotHooks.
#pragma once

#include "gui/main/shots/shot_context.h"

namespace cx::gui {

void AddMainShots(ShotContext& shots);
void AddDesignShots(ShotContext& shots);  // gui/design/design_shots.cpp
void AddDataShots(ShotContext& shots);  // gui/data/data_shots.cpp
void AddEditorShots(ShotContext& shots);  // gui/editor/editor_shots.cpp

using ShotHook = void (*)(ShotContext&);
inline constexpr ShotHook kShotHooks[] = {
    &AddMainShots,
    &AddDesignShots,
    &AddDataShots,
    &AddEditorShots,
};

}  // namespace cx::gui

// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cstdio>

#include "Kiln/Device.h"
#include "Vantrel/RenderSystem.h"

namespace {

VantrelHostStatus RefuseSuite(const char*, std::int32_t, const void** suite) {
    *suite = nullptr;
    return -1;
}

VantrelHostStatus ReleaseSuite(const char*, std::int32_t) { return 0; }

bool CheckWithoutSequence(const Kiln::DeviceRef& device) {
    const auto system = Vantrel::CreateRenderSystem(device, 0, false, "", 0, {});
    Vellum::Rect rect;
    Vellum::PixelAspectRatio aspect;
    Vellum::FrameRate rate;
    std::uint32_t fieldType = 0;
    return system->GetDevice() == device && system->UpdateTimeline() < 0 &&
           system->GetSequenceFormat(rect, aspect, rate, fieldType) == 99;
}

}  // namespace

int main() {
    QuillBasicSuite suite{RefuseSuite, ReleaseSuite};
    Vantrel::Initialize(&suite);
    Kiln::Initialize(true);
    const bool right = CheckWithoutSequence(Kiln::GetPrimaryDevice(Kiln::DeviceFramework::kCuda));
    Kiln::Terminate();
    Vantrel::Terminate();
    std::printf("%s\n", right ? "installed library works" : "installed library misbehaves");
    return right ? 0 : 1;
}

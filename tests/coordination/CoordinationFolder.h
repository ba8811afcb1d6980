// A test with its own coordination folder, which its agents share.
#pragma once

#include "platform/FileCoordination.h"
#include "support/TemporaryFolder.h"
#include "support/URLs.h"

#include <gtest/gtest.h>

class CoordinationFolder : public ::testing::Test {
protected:
    CoordinationFolder() { platform::FileCoordinator::setCoordinationFolder(folder()); }
    ~CoordinationFolder() override { platform::FileCoordinator::setCoordinationFolder({}); }

    std::string folder() const { return temporary_ / "coordination"; }
    std::string item(const std::string& name = "song.wav") const { return temporary_ / name; }
    platform::URLRef itemURL() const { return urlOf(item()); }

private:
    TemporaryFolder temporary_;
};

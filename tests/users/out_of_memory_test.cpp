#include <vorelix/users/audiousers.h>

#include "support/failing_allocator.h"
#include "support/files.h"
#include "support/platform_stand_in.h"

namespace {

using files::Folder;

class UsersOutOfMemory : public stand_in::Test {};

TEST_F(UsersOutOfMemory, AFileThatFindsNoRoomIsNotRead) {
    const Folder folder;
    const std::string text(7777, ' ');
    files::write(folder.path("users"), text + "{}");
    AudioUsers users;
    failing_allocator::failOnSize(text.size() + 3);
    EXPECT_FALSE(users.Read(folder.path("users")));
    EXPECT_TRUE(failing_allocator::hasFailed());
    EXPECT_EQ(stand_in::takeTrace(), "3 audiousers (190) Failed to malloc(7779).\n");
    EXPECT_TRUE(users.Read(folder.path("users")));
}

}  // namespace

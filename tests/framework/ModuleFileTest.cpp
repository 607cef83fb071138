#include "framework/ModuleFile.h"

#include <elf.h>
#include <gmock/gmock.h>

#include "tests/support/FileContent.h"
#include "tests/support/TemporaryFolder.h"

namespace vexo {
namespace {

using testing::HasSubstr;
using testing::Optional;

class ModuleFileTest : public testing::Test {
  protected:
    std::optional<std::string> problemOf(std::string_view content) const {
        return problemOfModuleFile(folder.writeFile("Module.so", content));
    }

    const testing_support::TemporaryFolder folder;
    const std::string module = testing_support::contentOf(EMPTY_MODULE);
};

TEST_F(ModuleFileTest, AModuleIsFine) {
    EXPECT_EQ(problemOf(module), std::nullopt);
    EXPECT_EQ(problemOfModuleFile(FAULTY_PLUGIN_MODULE), std::nullopt);
}

// The loader maps what the headers promise, and reading beyond the end of a file kills the process.
TEST_F(ModuleFileTest, WhatIsCutOffIsNone) {
    const auto* header = reinterpret_cast<const Elf64_Ehdr*>(module.data());
    if (header->e_ident[EI_CLASS] != ELFCLASS64)
        GTEST_SKIP() << "the sizes are those of 64 bits";
    const auto* segment = reinterpret_cast<const Elf64_Phdr*>(module.data() + header->e_phoff);
    std::size_t loaded = 0;
    for (int i = 0; i < header->e_phnum; ++i)
        if (segment[i].p_type == PT_LOAD)
            loaded = std::max<std::size_t>(loaded, segment[i].p_offset + segment[i].p_filesz);
    ASSERT_LE(loaded, module.size());
    for (std::size_t size = 0; size < loaded; size += 61)
        EXPECT_NE(problemOf(module.substr(0, size)), std::nullopt) << size;
    EXPECT_THAT(problemOf(module.substr(0, loaded - 1)), Optional(HasSubstr("cut off")));
    EXPECT_EQ(problemOf(module.substr(0, loaded)), std::nullopt);
}

TEST_F(ModuleFileTest, WhatWasBuiltForAnotherMachineIsNone) {
    for (const std::size_t field :
         {std::size_t(EI_CLASS), std::size_t(EI_DATA), offsetof(Elf64_Ehdr, e_machine)}) {
        std::string other = module;
        other[field] = static_cast<char>(other[field] ^ 3);
        EXPECT_THAT(problemOf(other), Optional(HasSubstr("another kind of machine"))) << field;
    }
}

TEST_F(ModuleFileTest, HeadersThatPointAnywhereAreDamage) {
    for (const std::size_t field : {offsetof(Elf64_Ehdr, e_phoff) + 4, offsetof(Elf64_Ehdr, e_phentsize)}) {
        std::string damaged = module;
        damaged.replace(field, 2, "\xff\xff");
        EXPECT_THAT(problemOf(damaged), Optional(HasSubstr("damaged"))) << field;
    }
}

TEST_F(ModuleFileTest, AnythingElseIsNone) {
    EXPECT_THAT(problemOf("#!/bin/sh\n"), Optional(HasSubstr("no module")));
    EXPECT_THAT(problemOf(std::string(4096, '\0')), Optional(HasSubstr("no module")));
    for (const std::string& path : {folder.path("missing.so"), folder.makeFolder("folder.so"),
                                    folder.makeFifo("pipe.so"), std::string("/dev/zero")})
        EXPECT_THAT(problemOfModuleFile(path), Optional(HasSubstr("cannot be read"))) << path;
}

}  // namespace
}  // namespace vexo

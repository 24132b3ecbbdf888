#pragma once

// The files the project installs for object managers, and the classes they
// declare, as the deployment tests read them.

#include "ClassRepository.h"

#include <optional>
#include <string>

namespace deploy
{

// mof/SELProvider.mof: the provider's classes.
std::string classMofPath();
// mof/SELProvider.reg: the SFCB registration.
std::string sfcbRegistrationPath();
// The OpenPegasus registration MOF as configured into the build tree.
std::string pegasusRegistrationPath();
// The DMTF schema directory the build was configured with, if any.
std::optional<std::string> schemaDirectory();

// The provider's classes alone.
const mof::ClassRepository& projectClasses();
// The provider's classes on top of every *.mof of the schema directory;
// throws std::logic_error when no schema directory is configured.
const mof::ClassRepository& projectAndSchemaClasses();
// The qualifier declarations of the schema directory.
const std::vector<mof::QualifierDeclaration>& schemaQualifiers();

// Skips the calling test when no schema directory is configured.
#define SKIP_WITHOUT_SCHEMA()                                                  \
    do                                                                         \
    {                                                                          \
        if (!::deploy::schemaDirectory())                                      \
        {                                                                      \
            GTEST_SKIP()                                                       \
                << "no DMTF schema directory configured "                      \
                   "(SELPROV_CIM_SCHEMA_DIR is empty): superclasses, "         \
                   "inherited properties and keys are not checked";            \
        }                                                                      \
    } while (false)

} // namespace deploy

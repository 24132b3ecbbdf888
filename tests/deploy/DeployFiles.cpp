#include "DeployFiles.h"

#include <algorithm>
#include <filesystem>
#include <stdexcept>

namespace deploy
{

namespace
{

std::vector<std::string> schemaFiles(const std::string& directory)
{
    std::vector<std::string> files;
    for (const auto& entry : std::filesystem::directory_iterator(directory))
    {
        if (entry.is_regular_file() && entry.path().extension() == ".mof")
        {
            files.push_back(entry.path().string());
        }
    }
    std::sort(files.begin(), files.end());
    return files;
}

struct Schema
{
    mof::ClassRepository classes;
    std::vector<mof::QualifierDeclaration> qualifiers;
};

const Schema& schema()
{
    static const Schema loaded = []
    {
        const auto directory = schemaDirectory();
        if (!directory)
        {
            throw std::logic_error("no schema directory configured");
        }
        Schema s;
        s.classes.add(mof::parseFile(classMofPath()));
        const std::vector<std::string> files = schemaFiles(*directory);
        if (files.empty())
        {
            throw mof::MofError(*directory + ": no .mof files");
        }
        for (const std::string& file : files)
        {
            mof::Document doc = mof::parseFile(file);
            s.classes.add(doc);
            for (auto& q : doc.qualifiers)
            {
                s.qualifiers.push_back(std::move(q));
            }
        }
        return s;
    }();
    return loaded;
}

} // namespace

std::string classMofPath()
{
    return std::string(SELPROV_SOURCE_DIR) + "/mof/SELProvider.mof";
}

std::string sfcbRegistrationPath()
{
    return std::string(SELPROV_SOURCE_DIR) + "/mof/SELProvider.reg";
}

std::string pegasusRegistrationPath()
{
    return SELPROV_PEGASUS_REGISTRATION;
}

std::optional<std::string> schemaDirectory()
{
    const std::string directory = SELPROV_CIM_SCHEMA_DIR;
    if (directory.empty())
    {
        return std::nullopt;
    }
    return directory;
}

const mof::ClassRepository& projectClasses()
{
    static const mof::ClassRepository classes = []
    {
        mof::ClassRepository r;
        r.add(mof::parseFile(classMofPath()));
        return r;
    }();
    return classes;
}

const mof::ClassRepository& projectAndSchemaClasses()
{
    return schema().classes;
}

const std::vector<mof::QualifierDeclaration>& schemaQualifiers()
{
    return schema().qualifiers;
}

} // namespace deploy

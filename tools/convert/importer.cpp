#include "importer.h"

#include "convert/files/modelfiles.h"
#include "convert/files/modelio.h"
#include "convert/formats/fbxpivots.h"
#include "convert/formats/halflifefile.h"
#include "convert/formats/mending.h"
#include "convert/formats/objoptions.h"
#include "convert/gltf/firstversion.h"
#include "convert/gltf/reader.h"
#include "figures.h"
#include "progress.h"

#include <assimp/config.h>
#include <assimp/importerdesc.h>
#include <assimp/postprocess.h>

#include <algorithm>
#include <filesystem>

namespace convert
{

namespace
{

const char* const NOTHING = "holds nothing that can be drawn";

std::string getFormatName(const Assimp::Importer& importer)
{
    const int index = importer.GetPropertyInteger("importerIndex", -1); // set by the importer
    const aiImporterDesc* format = index < 0 ? nullptr : importer.GetImporterInfo(size_t(index));
    return format ? format->mName : "";
}

bool contains(const std::string& text, const char* part)
{
    return text.find(part) != std::string::npos;
}

int getNumber(const aiScene& scene, const char* key, int fallback)
{
    int32_t number = fallback;
    return scene.mMetaData && scene.mMetaData->Get(key, number) ? number : fallback;
}

/// A matrix row that selects one of the file's axes, with its sign.
void setRow(aiMatrix4x4& matrix, unsigned row, int axis, int sign)
{
    for (unsigned column = 0; column < 3; ++column)
        matrix[row][column] = int(column) == axis ? (sign < 0 ? -1.0f : 1.0f) : 0.0f;
}

/// The importer reports an FBX file's axes and unit, but does not apply them.
aiMatrix4x4 makeFbxTransform(const aiScene& scene, bool turns)
{
    aiMatrix4x4 transform;
    const int right = getNumber(scene, "CoordAxis", 0);
    const int up = getNumber(scene, "UpAxis", 1);
    const int front = getNumber(scene, "FrontAxis", 2);
    const bool areAxes =
        std::min({right, up, front}) == 0 && right + up + front == 3 && right != up && up != front;
    if (turns && areAxes)
    {
        setRow(transform, 0, right, getNumber(scene, "CoordAxisSign", 1));
        setRow(transform, 1, up, getNumber(scene, "UpAxisSign", 1));
        setRow(transform, 2, front, getNumber(scene, "FrontAxisSign", 1));
    }
    double centimetres = 1.0;
    float single = 1.0f;
    if (scene.mMetaData && !scene.mMetaData->Get("UnitScaleFactor", centimetres) &&
        scene.mMetaData->Get("UnitScaleFactor", single))
        centimetres = double(single);
    constexpr double CENTIMETRES_PER_METRE = 100.0;
    const float metres = float(centimetres > 0.0 ? centimetres / CENTIMETRES_PER_METRE : 1.0);
    aiMatrix4x4 scale;
    aiMatrix4x4::Scaling(aiVector3D(metres), scale);
    return scale * transform;
}

/// Turns the axis to y.
aiMatrix4x4 makeUpright(const std::string& axis)
{
    constexpr float QUARTER = 1.5707964f;
    aiMatrix4x4 turn;
    if (axis == "x")
        aiMatrix4x4::RotationZ(QUARTER, turn);
    else if (axis == "z")
        aiMatrix4x4::RotationX(-QUARTER, turn);
    return turn;
}

aiMatrix4x4 makeTransform(const aiScene& scene, const std::string& format, const Options& options)
{
    const bool isUpright = contains(format, "Blender") || contains(format, "SMD"); // z is always up there
    const std::string up = options.up.empty() && isUpright ? "z" : options.up;
    aiMatrix4x4 scale;
    aiMatrix4x4::Scaling(aiVector3D(float(options.scale)), scale);
    const aiMatrix4x4 own =
        contains(format, "FBX") ? makeFbxTransform(scene, options.up.empty()) : aiMatrix4x4();
    return scale * makeUpright(up) * own;
}

/// Drops missing joints; vertices follow the others.
void dropLostJoints(aiScene& scene, Report& report)
{
    for (unsigned i = 0; i < scene.mNumMeshes; ++i)
    {
        const aiMesh& mesh = *scene.mMeshes[i];
        for (unsigned b = 0; b < mesh.mNumBones; ++b)
        {
            aiBone& bone = *mesh.mBones[b];
            if (bone.mNumWeights == 0 || scene.mRootNode->FindNode(bone.mName))
                continue;
            bone.mNumWeights = 0;
            report.lose("joint", "joint \"" + std::string(bone.mName.C_Str()) + "\" of mesh \"" +
                                     mesh.mName.C_Str() + "\", which is no node of the model");
        }
    }
}

/// The importer of 3DS files loses camera directions if the file has nodes.
void reportCameras(const aiScene& scene, Report& report)
{
    for (unsigned i = 0; i < scene.mNumCameras; ++i)
        report.lose("camera-direction", "where camera \"" + std::string(scene.mCameras[i]->mName.C_Str()) +
                                            "\" looks, which libassimp does not read from 3DS files");
}

/// The library makes a mesh for a file with only a skeleton.
void reportSkeletonBody(const aiScene& scene, Report& report)
{
    aiString name;
    if (scene.mNumMaterials == 1 && scene.mMaterials[0]->Get(AI_MATKEY_NAME, name) == aiReturn_SUCCESS &&
        name == aiString("SkeletonMaterial"))
        report.approximate("skeleton-body", "a file without meshes: its nodes are shown as bones");
}

bool fail(const std::string& reason, std::string& error)
{
    error = reason.empty() ? "libassimp does not say why" : reason;
    return false;
}

/// Opens a glTF file; other files give another kind.
gltf::Opened openGltf(const std::string& path, ModelFiles& files, const Assimp::Importer& importer)
{
    gltf::Bytes bytes(64);
    const File file = files.open(path);
    bytes.resize(file ? std::fread(bytes.data(), 1, bytes.size(), file.get()) : 0);
    const bool isOthers = importer.IsExtensionSupported(std::filesystem::path(path).extension().string());
    if (!gltf::mayBeGltf(bytes, path, isOthers) || !files.read(path, bytes))
        return {};
    return gltf::openGltf(std::move(bytes), path);
}

/// The importer's own scene, which nobody else holds.
aiScene& getOwn(const ImportedModel& model)
{
    return const_cast<aiScene&>(*model.scene); // NOLINT(cppcoreguidelines-pro-type-const-cast)
}

bool readByLibrary(const std::string& path, const gltf::Opened& opened, ImportedModel& model, Report& report,
                   std::string& error)
{
    model.scene = model.importer.ReadFile(path, 0);
    if (!model.scene)
        return fail(model.importer.GetErrorString(), error);
    aiScene& scene = getOwn(model);
    if (scene.mRootNode && opened.kind == gltf::Opened::Kind::FIRST)
        gltf::correctFirstVersion(scene, opened.document.get(), report);
    if (scene.mRootNode)
        mend(scene, report);
    return (scene.mRootNode && scene.mNumMeshes > 0) || fail(NOTHING, error);
}

/// Reads with libassimp's validation. If that fails, libassimp drops the scene; it also fails for some valid files, so
/// the file is read again without it.
bool readAndValidate(const std::string& path, const gltf::Opened& opened, ImportedModel& model,
                     Report& report, std::string& error)
{
    const Report before = report;
    if (!readByLibrary(path, opened, model, report, error))
        return false;
    if (model.importer.ApplyPostProcessing(aiProcess_ValidateDataStructure))
        return true;
    const std::string finding = model.importer.GetErrorString();
    report = before;
    report.approximate("validation", "a fault found by libassimp: " + finding);
    return readByLibrary(path, opened, model, report, error);
}

bool importOther(const std::string& path, ModelFiles& files, const Options& options,
                 const gltf::Opened& opened, ImportedModel& model, Report& report, std::string& error)
{
    Assimp::Importer& importer = model.importer;
    importer.SetIOHandler(new ModelIo(files));       // owned by the importer
    importer.SetProgressHandler(new ImportProgress); // as well
    importer.SetPropertyBool(AI_CONFIG_IMPORT_COLLADA_IGNORE_UP_DIRECTION, !options.up.empty());
    if (!readAndValidate(path, opened, model, report, error))
        return false;
    aiScene& scene = getOwn(model);
    const std::string format = getFormatName(importer);
    report.setFormat(format);
    countModel(scene, report);
    reportSkeletonBody(scene, report);
    if (scene.mRootNode->mName == aiString("<MDL_root>"))
        correctHalfLife(scene, path, files);
    if (contains(format, "FBX"))
        correctFbx(scene, report);
    if (contains(format, "Wavefront"))
        correctObj(scene, path, files, report);
    model.hidesColours = contains(format, "Blender"); // there the material decides
    if (contains(format, "3DS"))
        reportCameras(scene, report);
    dropLostJoints(scene, report);
    model.toScene = makeTransform(scene, format, options);
    model.scene = importer.ApplyPostProcessing(aiProcess_Triangulate | aiProcess_GenUVCoords |
                                               aiProcess_TransformUVCoords | aiProcess_SortByPType);
    return model.scene || fail(importer.GetErrorString(), error);
}

bool importGltf(gltf::Opened&& opened, ModelFiles& files, const Options& options, ImportedModel& model,
                Report& report, std::string& error)
{
    const auto open = [&](const std::string& uri, gltf::Bytes& bytes) { return files.readNamed(uri, bytes); };
    model.own = gltf::readGltf(std::move(opened.document), open, options, report);
    model.scene = model.own.get();
    mend(*model.own, report);
    if (model.own->mNumMeshes == 0)
        return fail(NOTHING, error);
    report.setFormat("glTF2");
    countModel(*model.own, report);
    dropLostJoints(*model.own, report);
    model.toScene = makeTransform(*model.own, "glTF2", options);
    return true;
}

} // namespace

bool importModel(const std::string& path, ModelFiles& files, const Options& options, ImportedModel& model,
                 Report& report, std::string& error)
{
    try
    {
        gltf::Opened opened = openGltf(path, files, model.importer);
        if (opened.kind == gltf::Opened::Kind::SECOND)
            return importGltf(std::move(opened), files, options, model, report, error);
        return importOther(path, files, options, opened, model, report, error);
    }
    catch (const gltf::Fault& fault)
    {
        return fail(fault.what(), error);
    }
}

} // namespace convert

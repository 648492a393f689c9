#pragma once

#include "convert/options.h"
#include "convert/outputfiles.h"
#include "convert/report.h"
#include "picturefinder.h"
#include "pictures.h"

#include "orv/vector.h"

#include <array>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <tuple>
#include <vector>

namespace convert
{

/// What a material needs from a picture.
struct TextureWish
{
    enum class Alpha
    {
        AUTO, ///< opacity, unless the whole picture would be invisible
        KEEP, ///< opacity
        DROP, ///< nothing
        CUT   ///< opaque from the threshold on, invisible below; removed if all is opaque
    };

    std::string path;    ///< as the material names it
    std::string opacity; ///< of a picture whose brightness is the opacity; empty for none
    Alpha alpha = Alpha::KEEP;
    float threshold = 0.0f;         ///< of CUT; 0 to 1
    bool repeats = false;           ///< coordinates go beyond the picture
    bool isHeight = false;          ///< heights, wanted as normals
    std::optional<float> occlusion; ///< its strength: see makeOcclusion()
    bool isShare = false;           ///< of an occlusion: likewise
    /// Filters and wrapping, which the engine ties to the picture's name.
    std::array<uint32_t, 4> sampling = {};

    auto tie() const
    {
        return std::tie(path, opacity, alpha, threshold, repeats, isHeight, occlusion, isShare, sampling);
    }
    bool operator<(const TextureWish& other) const { return tie() < other.tie(); }
};

struct TextureUse
{
    std::string name;            ///< of the file for the scene; empty if the picture cannot be read
    bool hasAlpha = false;       ///< some of it is transparent
    bool isAllOrNothing = false; ///< and hardly any of it partly; false if not decoded
    bool isPowerOfTwo = true;    ///< both sides are
};

/// The prefix of the names of a scene's pictures, which no other scene's pictures have: it ends with the last '-' of the
/// name, and a hash stands for what file names cannot hold.
/// @param stem  the scene file's name without its extension.
std::string getPictureStem(const std::string& stem);

/// Finds the pictures of a model and makes files that the engine can use.
///
/// Pictures are copied byte for byte if possible. Rewritten as PNG are formats that the engine cannot read, grey
/// pictures, which it would read as opacity, unwanted alpha, and sizes that GL cannot repeat.
class TextureStore
{
public:
    /// @param files  the model's, as scene for as long as this lives.
    /// @param stem   prefix of every name, so that conversions into one folder do not collide.
    TextureStore(const aiScene& scene, ModelFiles& files, const std::string& stem, const Options& options,
                 Report& report);

    TextureUse add(const TextureWish& wish);

    /// A picture that the model does not have.
    /// @return the name of its file; the same for the same name.
    std::string addMade(const std::string& name, DecodedPicture (*paint)());

    /// The mean red, green, blue and alpha of a picture, 0 to 1; nothing if it cannot be read.
    std::optional<orv::Vector4f> getMean(const std::string& path);

    const std::vector<OutputFile>& getFiles() const { return m_files; }

private:
    /// A picture as found and, if needed, its pixels.
    struct Loaded
    {
        FoundPicture file;
        PictureHeader header;
        DecodedPicture pixels;
    };

    struct Size
    {
        int width, height;
    };

    std::optional<Loaded> load(const std::string& path);
    bool decode(Loaded& loaded, const std::string& path);
    TextureUse make(const TextureWish& wish);
    bool canPassOn(const PictureHeader& header, const TextureWish& wish) const;
    TextureUse passOn(const Loaded& loaded, const TextureWish& wish);
    bool treat(DecodedPicture& pixels, const TextureWish& wish);
    Size getFittingSize(int width, int height, bool repeats) const;
    std::string makeName(const std::string& name, const std::string& extension);

    PictureFinder m_finder;
    std::string m_stem;
    Options m_options;
    Report& m_report;
    std::map<TextureWish, TextureUse> m_known;
    std::map<std::string, std::string> m_made; ///< files by name, see addMade()
    std::map<std::string, std::optional<orv::Vector4f>> m_means;
    std::set<std::string> m_names;
    std::vector<OutputFile> m_files;
};

} // namespace convert

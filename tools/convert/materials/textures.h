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

/// What a material wants of a picture.
struct TextureWish
{
    enum class Alpha
    {
        AUTO, ///< opacity, unless the picture would be invisible all over
        KEEP, ///< opacity
        DROP, ///< nothing
        CUT   ///< opaque from the threshold on, invisible below; where all is opaque, nothing
    };

    std::string path;    ///< as the material names it
    std::string opacity; ///< of a picture whose brightness is the opacity; empty for none
    Alpha alpha = Alpha::KEEP;
    float threshold = 0.0f;         ///< of CUT; 0 to 1
    bool repeats = false;           ///< coordinates leave the picture
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
    std::string name;      ///< of the file that the scene is to name; empty if the picture cannot be had
    bool hasAlpha = false; ///< some of it is transparent
    bool isAllOrNothing = false; ///< and hardly any of it in part; not known of what is not decoded
    bool isPowerOfTwo = true;    ///< both sides are
};

/// What the names of a scene's pictures begin with.
/// @param stem  the scene file's name without its extension.
std::string getPictureStem(const std::string& stem);

/// Finds the pictures of a model and makes them files that the engine shows right.
///
/// Pictures are passed on byte for byte where that will do; what the engine cannot read, grey ones, which it would
/// take for opacity, unwanted alpha and sizes that GL cannot repeat become PNG.
class TextureStore
{
public:
    /// @param files  the model's, as scene for as long as this lives.
    /// @param stem   begins every name, so that two conversions into one folder keep apart.
    TextureStore(const aiScene& scene, ModelFiles& files, const std::string& stem, const Options& options,
                 Report& report);

    TextureUse add(const TextureWish& wish);

    /// A picture that the model does not have.
    /// @return the name of its file, the same for the same name.
    std::string addMade(const std::string& name, DecodedPicture (*paint)());

    /// The mean red, green, blue and alpha of a picture, 0 to 1; nothing if it cannot be had.
    std::optional<orv::Vector4f> getMean(const std::string& path);

    const std::vector<OutputFile>& getFiles() const { return m_files; }

private:
    /// A picture, as found and, where somebody needs them, its pixels.
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

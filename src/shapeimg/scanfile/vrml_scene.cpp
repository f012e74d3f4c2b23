#include "shapeimg/scanfile/vrml_scene.h"

#include "fn/shapefile/scan_text.h"

#include <istream>

namespace ShapeImage {

namespace {

constexpr std::size_t longestToken = 1023;
constexpr std::size_t deepestNode = 256;

/// A word, a text in double quotes, or one of { } [ ].
struct Token {
    enum class Kind { End, Word, Text, Mark } kind;
    std::string text;

    bool is(char mark) const { return kind == Kind::Mark && text[0] == mark; }
};

class Tokens {
public:
    explicit Tokens(std::istream& stream) : buffer_(*stream.rdbuf()) {}

    Token next() {
        int c = buffer_.sgetc();
        for (; isSpace(c) || c == '#'; c = buffer_.sgetc())
            if (c == '#')
                skipLine();
            else
                buffer_.sbumpc();
        if (c == end) return {Token::Kind::End, {}};
        if (isMark(c)) return {Token::Kind::Mark, std::string(1, static_cast<char>(buffer_.sbumpc()))};
        if (c == '"') return {Token::Kind::Text, quoted()};
        std::string word;
        for (; c != end && !isSpace(c) && !isMark(c) && c != '"' && c != '#'; c = buffer_.snextc())
            append(word, c);
        return {Token::Kind::Word, word};
    }

private:
    static constexpr int end = std::char_traits<char>::eof();

    /// Commas count as blanks.
    static bool isSpace(int c) { return c == ' ' || c == '\t' || c == '\n' || c == '\r' || c == ','; }
    static bool isMark(int c) { return c == '{' || c == '}' || c == '[' || c == ']'; }
    static void append(std::string& text, int c) {
        if (text.size() == longestToken) FN_THROW(FNEBadArg, "VRML: word too long");
        text += static_cast<char>(c);
    }
    void skipLine() {
        for (int c = buffer_.sgetc(); c != '\n' && c != end;) c = buffer_.snextc();
    }
    std::string quoted() {
        std::string text;
        for (int c = buffer_.snextc(); c != '"'; c = buffer_.snextc()) {
            if (c == '\\') c = buffer_.snextc();
            if (c == end) FN_THROW(FNEBadArg, "VRML: text without an end");
            append(text, c);
        }
        buffer_.sbumpc();
        return text;
    }

    std::streambuf& buffer_;
};

/// Walks over the nodes and keeps what belongs to shapes.
class SceneReader {
public:
    explicit SceneReader(std::istream& stream) : tokens_(stream) {}

    std::list<VrmlShape> read() {
        for (Token token = tokens_.next(); token.kind != Token::Kind::End; token = tokens_.next()) {
            if (token.is('{')) {
                beginNode();
            } else if (token.is('}')) {
                endNode();
            } else if (token.is('[')) {
                beginList();
            } else if (token.is(']')) {
                if (open_.empty() || open_.back() != list)
                    FN_THROW(FNEBadArg, "VRML: unexpected list end found");
                open_.pop_back();
            } else if (token.kind == Token::Kind::Text) {
                addPicture(token.text);
            } else {
                word_ = token.text;
            }
        }
        if (!open_.empty()) FN_THROW(FNEBadArg, "VRML: premature eof condition");
        return shapes_;
    }

private:
    static constexpr const char* list = "[";

    void push(const std::string& name) {
        if (open_.size() == deepestNode) FN_THROW(FNEBadArg, "VRML: too many nodes in nodes");
        open_.push_back(name);
    }
    void beginNode() {
        if (word_ == "Shape") {
            shape_ = VrmlShape();
            faces_ = textureFaces_ = Faces();
        }
        push(word_);
    }
    void endNode() {
        if (open_.empty() || open_.back() == list) FN_THROW(FNEBadArg, "Unexpected node end found");
        if (open_.back() == "Shape") endShape();
        open_.pop_back();
    }

    void beginList() {
        const std::string node = open_.empty() ? "" : open_.back();
        if (node == "Coordinate" && word_ == "point")
            readVertices();
        else if (node == "TextureCoordinate" && word_ == "point")
            readTextureCoordinates();
        else if (node == "IndexedFaceSet" && word_ == "coordIndex")
            faces_ = readFaces();
        else if (node == "IndexedFaceSet" && word_ == "texCoordIndex")
            textureFaces_ = readFaces();
        else
            push(list);
    }
    void addPicture(const std::string& name) {
        // The url is a text, or a list of them in order of preference.
        const std::size_t inside = !open_.empty() && open_.back() == list ? 2 : 1;
        if (open_.size() < inside || open_[open_.size() - inside] != "ImageTexture" || word_ != "url") return;
        if (shape_.picture.empty()) shape_.picture = name;
    }

    /// The numbers of a list, up to its end.
    template <class T> std::vector<T> readNumbers() {
        std::vector<T> numbers;
        for (Token token = tokens_.next(); !token.is(']'); token = tokens_.next()) {
            if (token.is('}')) FN_THROW(FNEBadArg, "Unexpected node end found");
            T number{};
            if (token.kind != Token::Kind::Word || !Fn::parseNumber(token.text, number))
                FN_THROW(FNEBadArg, "Inappropriate vertex list element");
            numbers.push_back(number);
        }
        return numbers;
    }
    static void checkSize(std::size_t numbers, std::size_t perElement, const char* element) {
        if (numbers % perElement == 0) return;
        FN_THROW(FNEBadArg, std::string("String list size not appropriate to read ") + element + " element " +
                                std::to_string(numbers / perElement));
    }
    void readVertices() {
        const auto numbers = readNumbers<double>();
        checkSize(numbers.size(), 3, "vertex");
        shape_.mesh.vertices.clear();
        for (std::size_t i = 0; i < numbers.size(); i += 3)
            shape_.mesh.vertices.push_back({numbers[i], numbers[i + 1], numbers[i + 2]});
    }
    void readTextureCoordinates() {
        const auto numbers = readNumbers<double>();
        checkSize(numbers.size(), 2, "vector");
        shape_.mesh.textureCoordinates.clear();
        for (std::size_t i = 0; i < numbers.size(); i += 2)
            shape_.mesh.textureCoordinates.emplace_back(numbers[i], numbers[i + 1]);
    }

    struct Faces {
        std::vector<std::int32_t> corners;
        std::vector<std::size_t> ends; ///< of each face, among the corners
    };
    /// Faces end with -1; the last one may go without.
    Faces readFaces() {
        Faces faces;
        std::size_t begin = 0;
        const auto endFace = [&] {
            if (faces.corners.size() < begin + 3)
                FN_THROW(FNEBadArg, "String list size not appropriate to read face element " +
                                        std::to_string(faces.ends.size()));
            faces.ends.push_back(begin = faces.corners.size());
        };
        for (const std::int64_t number : readNumbers<std::int64_t>()) {
            if (number < -1 || number > std::numeric_limits<std::int32_t>::max())
                FN_THROW(FNEBadArg, "Inappropriate vertex list element");
            if (number == -1)
                endFace();
            else
                faces.corners.push_back(static_cast<std::int32_t>(number));
        }
        if (faces.corners.size() > begin) endFace();
        return faces;
    }

    void endShape() {
        // Without a list of their own, texture coordinates have the numbers of the vertices.
        const Faces& other = textureFaces_.ends.empty() ? faces_ : textureFaces_;
        if (other.ends != faces_.ends)
            FN_THROW(FNEBadArg, "Coordinate face list size does not match texture face list size");
        if (!shape_.mesh.textureCoordinates.empty())
            for (std::size_t i = 0; i < faces_.corners.size(); ++i)
                shape_.mesh.corners.push_back({faces_.corners[i], other.corners[i]});
        if (!shape_.mesh.vertices.empty()) shapes_.push_back(shape_);
        shape_ = VrmlShape();
        faces_ = textureFaces_ = Faces();
    }

    Tokens tokens_;
    std::vector<std::string> open_; ///< names of the nodes and lists around the present place
    std::string word_;              ///< the last one: what a node or list belongs to
    VrmlShape shape_;
    Faces faces_, textureFaces_;
    std::list<VrmlShape> shapes_;
};

} // namespace

std::list<VrmlShape> readVrmlScene(std::istream& stream) {
    return SceneReader(stream).read();
}

} // namespace ShapeImage

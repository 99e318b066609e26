#include "tools/scene/json_locator.h"

#include <cstdint>
#include <set>

namespace apescene {
namespace {

// Walks a JSON text value by value, recording where each one starts.
class Walker {
 public:
  Walker(const std::string& text, std::map<std::string, int>* lines, bool* has_duplicate,
         DocPath* duplicate, bool* too_deep)
      : text_(text),
        lines_(lines),
        has_duplicate_(has_duplicate),
        duplicate_(duplicate),
        too_deep_(too_deep) {}

  void Run() {
    SkipSpace();
    Value(DocPath());
  }

 private:
  bool AtEnd() const { return pos_ >= text_.size(); }
  char Peek() const { return AtEnd() ? '\0' : text_[pos_]; }
  void Advance() {
    if (text_[pos_] == '\n') ++line_;
    ++pos_;
  }
  // Spaces and the comments the parser is told to accept: /* */, and // up to a line end, which
  // for the parser is a carriage return or a NUL as well as a newline.
  void SkipSpace() {
    for (;;) {
      while (!AtEnd() && (Peek() == ' ' || Peek() == '\t' || Peek() == '\n' || Peek() == '\r'))
        Advance();
      if (Peek() != '/' || pos_ + 1 >= text_.size()) return;
      if (text_[pos_ + 1] == '/') {
        while (!AtEnd() && Peek() != '\n' && Peek() != '\r' && Peek() != '\0') Advance();
      } else if (text_[pos_ + 1] == '*') {
        Advance();
        Advance();
        while (!AtEnd() && !(Peek() == '*' && pos_ + 1 < text_.size() && text_[pos_ + 1] == '/'))
          Advance();
        if (!AtEnd()) Advance();
        if (!AtEnd()) Advance();
      } else {
        return;
      }
    }
  }

  void Value(const DocPath& path) {
    if (AtEnd() || *too_deep_) return;
    if (path.Steps().size() > static_cast<std::size_t>(JsonLocator::kMaximumDepth)) {
      *too_deep_ = true;
      pos_ = text_.size();  // abandon the walk
      return;
    }
    lines_->emplace(path.Text(), line_);  // a duplicate key keeps the line set for it
    switch (Peek()) {
      case '{':
        Object(path);
        break;
      case '[':
        Array(path);
        break;
      case '"':
        String();
        break;
      default:  // number or literal: runs to a delimiter
        while (!AtEnd() && Peek() != ',' && Peek() != '}' && Peek() != ']' && Peek() != ' ' &&
               Peek() != '\n' && Peek() != '\r' && Peek() != '\t' && Peek() != '/')
          Advance();
    }
  }

  void Object(const DocPath& path) {
    Advance();  // {
    SkipSpace();
    std::set<std::string> seen;
    while (!AtEnd() && Peek() != '}') {
      const std::size_t start = pos_;
      const std::string key = String();
      if (!seen.insert(key).second && !*has_duplicate_) {
        *has_duplicate_ = true;
        *duplicate_ = path.Key(key);
        // The line of the second one, which is where the walk is now.
        (*lines_)[duplicate_->Text()] = line_;
      }
      SkipSpace();
      if (Peek() == ':') Advance();
      SkipSpace();
      Value(path.Key(key));
      SkipSpace();
      if (Peek() == ',') Advance();
      SkipSpace();
      if (pos_ == start) break;  // a text read otherwise than the parser did: never loop in place
    }
    if (!AtEnd()) Advance();
  }

  void Array(const DocPath& path) {
    Advance();  // [
    SkipSpace();
    std::size_t index = 0;
    while (!AtEnd() && Peek() != ']') {
      const std::size_t start = pos_;
      Value(path.Index(index++));
      SkipSpace();
      if (Peek() == ',') Advance();
      SkipSpace();
      if (pos_ == start) break;  // a text read otherwise than the parser did: never loop in place
    }
    if (!AtEnd()) Advance();
  }

  // Reads a string literal and answers its decoded text (UTF-8), as the parser decodes keys.
  std::string String() {
    std::string out;
    if (Peek() != '"') return out;
    Advance();
    while (!AtEnd() && Peek() != '"') {
      char c = Peek();
      Advance();
      if (c != '\\') {
        out += c;
        continue;
      }
      if (AtEnd()) break;
      const char e = Peek();
      Advance();
      switch (e) {
        case 'n':
          out += '\n';
          break;
        case 't':
          out += '\t';
          break;
        case 'r':
          out += '\r';
          break;
        case 'b':
          out += '\b';
          break;
        case 'f':
          out += '\f';
          break;
        case 'u':
          AppendUtf8(ReadEscapedCodePoint(), &out);
          break;
        default:
          out += e;  // \" \\ \/
      }
    }
    if (!AtEnd()) Advance();
    return out;
  }

  std::uint32_t ReadHex4() {
    std::uint32_t value = 0;
    for (int i = 0; i < 4 && !AtEnd(); ++i) {
      const char c = Peek();
      Advance();
      value <<= 4;
      if (c >= '0' && c <= '9')
        value |= static_cast<std::uint32_t>(c - '0');
      else if (c >= 'a' && c <= 'f')
        value |= static_cast<std::uint32_t>(c - 'a' + 10);
      else if (c >= 'A' && c <= 'F')
        value |= static_cast<std::uint32_t>(c - 'A' + 10);
    }
    return value;
  }

  std::uint32_t ReadEscapedCodePoint() {
    std::uint32_t code = ReadHex4();
    // A high surrogate is followed by "\uDCxx" in valid JSON.
    if (code >= 0xD800 && code <= 0xDBFF && pos_ + 1 < text_.size() && text_[pos_] == '\\' &&
        text_[pos_ + 1] == 'u') {
      Advance();
      Advance();
      const std::uint32_t low = ReadHex4();
      code = 0x10000 + ((code - 0xD800) << 10) + (low - 0xDC00);
    }
    return code;
  }

  static void AppendUtf8(std::uint32_t code, std::string* out) {
    if (code < 0x80) {
      *out += static_cast<char>(code);
    } else if (code < 0x800) {
      *out += static_cast<char>(0xC0 | (code >> 6));
      *out += static_cast<char>(0x80 | (code & 0x3F));
    } else if (code < 0x10000) {
      *out += static_cast<char>(0xE0 | (code >> 12));
      *out += static_cast<char>(0x80 | ((code >> 6) & 0x3F));
      *out += static_cast<char>(0x80 | (code & 0x3F));
    } else {
      *out += static_cast<char>(0xF0 | (code >> 18));
      *out += static_cast<char>(0x80 | ((code >> 12) & 0x3F));
      *out += static_cast<char>(0x80 | ((code >> 6) & 0x3F));
      *out += static_cast<char>(0x80 | (code & 0x3F));
    }
  }

  const std::string& text_;
  std::map<std::string, int>* lines_;
  bool* has_duplicate_;
  DocPath* duplicate_;
  bool* too_deep_;
  std::size_t pos_ = 0;
  int line_ = 1;
};

}  // namespace

JsonLocator::JsonLocator(const std::string& text) {
  Walker(text, &lines_, &has_duplicate_, &duplicate_, &too_deep_).Run();
}

int JsonLocator::LineOf(const DocPath& path) const {
  std::vector<DocPath::Step> steps = path.Steps();
  for (;;) {
    DocPath candidate;
    for (const DocPath::Step& step : steps)
      candidate = std::holds_alternative<std::string>(step)
                      ? candidate.Key(std::get<std::string>(step))
                      : candidate.Index(std::get<std::size_t>(step));
    const auto found = lines_.find(candidate.Text());
    if (found != lines_.end()) return found->second;
    if (steps.empty()) return 0;
    steps.pop_back();
  }
}

void JsonLocator::LineAndColumn(const std::string& text, std::size_t offset, int* line,
                                int* column) {
  *line = 1;
  *column = 1;
  for (std::size_t i = 0; i < offset && i < text.size(); ++i) {
    if (text[i] == '\n') {
      ++*line;
      *column = 1;
    } else {
      ++*column;
    }
  }
}

}  // namespace apescene

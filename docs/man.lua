-- Turns a page of docs/ into a man page, for pandoc's "man" writer. The page keeps the form that reads well on a
-- code host; this gives it the form that people expect from man: a NAME section, headings in capitals, and
-- tables of two columns as lists of terms. The title and the summary come with --metadata.

local function is_relative(target)
  return not target:match("^%a[%w+.-]*:")
end

-- A file that a relative link leads to is not beside a man page.
function Link(link)
  if is_relative(link.target) then
    return link.content
  end
end

-- The terminal's fixed font shows nothing special, and bold is what man pages have for what is typed.
function Code(code)
  return pandoc.Strong(pandoc.Str(code.text))
end

function Table(table)
  local simple = pandoc.utils.to_simple_table(table)
  if #simple.headers ~= 2 then
    return nil
  end
  local items = {}
  for _, row in ipairs(simple.rows) do
    items[#items + 1] = { pandoc.utils.blocks_to_inlines(row[1]), { row[2] } }
  end
  return pandoc.DefinitionList(items)
end

-- Of words, but not of what was code: that has to be typed as it is.
local function capitals(inlines)
  return inlines:map(function(inline)
    return inline.t == "Str" and pandoc.Str(pandoc.text.upper(inline.text)) or inline
  end)
end

function Pandoc(document)
  local title = pandoc.utils.stringify(document.meta.title)
  local summary = pandoc.utils.stringify(document.meta.summary)
  local blocks = {
    pandoc.Header(1, "NAME"),
    pandoc.Para(title .. " - " .. summary),
  }
  local has_introduction = false
  for _, block in ipairs(document.blocks) do
    if block.t == "Header" then
      if block.level == 2 then
        blocks[#blocks + 1] = pandoc.Header(1, capitals(block.content))
      elseif block.level > 2 then
        block.level = block.level - 1
        blocks[#blocks + 1] = block
      end
      has_introduction = has_introduction or block.level > 1
    else
      if not has_introduction then
        blocks[#blocks + 1] = pandoc.Header(1, "DESCRIPTION")
        has_introduction = true
      end
      blocks[#blocks + 1] = block
    end
  end
  return pandoc.Pandoc(blocks, document.meta)
end

;; ZVListas user configuration of the demo. The product data folder (the value of
;; *DIRETORIO_REDE*) holds DADOS/<standard>/BLOCOS/<block>.dxf, templates/ and config/; it is
;; $ZV_PRODUCT_DIR when set (ending in "/"), else out/demo/produto/ below the current folder.
(setq *ZV_PRODUTO* (getenv "ZV_PRODUCT_DIR"))
(if (or (not *ZV_PRODUTO*) (= *ZV_PRODUTO* "")) (setq *ZV_PRODUTO* "out/demo/produto/"))

(setq *DIRETORIO_REDE* *ZV_PRODUTO*)
(setq *DIR_ZVCFG_TEMPL* (strcat *ZV_PRODUTO* "templates/"))
(setq *DIR_ZVCFG* (strcat *ZV_PRODUTO* "config/"))

;; Default templates: the list commands take these without asking.
(setq *USAR_DEF_LISTA_BORNES* T)
(setq *DEF_LISTA_BORNES* "bornes.grt")
(setq *USAR_DEF_LISTA_BOR_DES* T)
(setq *DEF_LISTA_BOR_DES* "reguas.grx")
(setq *USAR_DEF_LISTA_FIOS* T)
(setq *DEF_LISTA_FIOS* "fios.grw")
(setq *USAR_DEF_LISTA_MATERIAL* T)
(setq *DEF_LISTA_MATERIAL* "materiais.grf")
(setq *USAR_DEF_LISTA_CABOS* T)
(setq *DEF_LISTA_CABOS* "cabos.grc")

;; Project-wide reading settings.
(setq *ESPESSURA_BARRAMENTO* 0.1)
(setq *NUMERAR_POR_PROJ* "S")
(setq *EXPORT_CHAR_SEP* ":")
(setq *EXPORT_CHAR_SEP_LIG* "/")
(setq *EXPORT_ORDEM_REL* "1")
(setq PBLCOMPFIOPORCENTO 10.0)
(setq PBLCOMPFIOABSOLUTO 150.0)
(setq PBLADDATRIBACE nil)
(setq CFG_NOME "demo")
